#pragma once

#include "finding.h"
#include "user_check.h"

namespace velk::check {

/// The daemon's information file: whether it can be read, and what the agent misses in it.
Findings checkInformationFile(const SessionUser& user);

/// The identifier that the platform knows the terminal by.
Finding checkMachineIdentifier();

/// What the exit from the domain restores from.
Findings checkRestoreFiles();

} // namespace velk::check
