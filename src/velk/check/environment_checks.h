#pragma once

#include "finding.h"

namespace velk::check {

/// The package tools that software reports need. Runs each, for 60 s at most.
Findings checkPackageTools();

/// The agent's unit and its process: there must be exactly one agent.
Findings checkAgent();

} // namespace velk::check
