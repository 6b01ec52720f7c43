#pragma once

#include "finding.h"

namespace velk::check {

/// The services that the agent speaks with, whether they are on their buses now. None is started.
Findings checkServices();

/// The package tools that the reports of software need. Each is run, 60 s at most.
Findings checkPackageTools();

/// The agent's unit and its process: there must be exactly one agent.
Findings checkAgent();

} // namespace velk::check
