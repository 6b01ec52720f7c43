#pragma once

#include "finding.h"

namespace velk::check {

/// The package tools that the reports of software need. Each is run, 60 s at most.
Findings checkPackageTools();

/// The agent's unit and its process: there must be exactly one agent.
Findings checkAgent();

} // namespace velk::check
