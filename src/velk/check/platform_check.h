#pragma once

#include "finding.h"
#include "user_check.h"

namespace velk::check {

/// Requests one unread message from the platform, as the agent does, but neither shows it nor marks it read.
/// Takes 30 s at most. Needs a CapturedLog for the reason of a missing answer.
Finding checkPlatform(const SessionUser& user);

} // namespace velk::check
