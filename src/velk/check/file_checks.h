#pragma once

#include "finding.h"
#include "user_check.h"

namespace velk::check {

/// The daemon's information file: whether it can be read, and what it lacks.
Findings checkInformationFile(const SessionUser& user);

/// The terminal's identifier on the platform.
Finding checkMachineIdentifier();

/// The files that the exit from the domain restores from.
Findings checkRestoreFiles();

} // namespace velk::check
