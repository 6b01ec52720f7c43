#pragma once

#include "finding.h"
#include "user_check.h"

namespace velk::check {

/// Asks the platform for one unread message, the way the agent does, and neither shows it nor marks it read.
/// Takes 30 s at most. Needs a CapturedLog, which knows why there was no answer.
Finding checkPlatform(const SessionUser& user);

} // namespace velk::check
