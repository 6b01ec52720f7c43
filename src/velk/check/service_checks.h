#pragma once

#include "finding.h"

namespace velk::check {

/// The services that the agent uses: whether they are on their buses now, and whether those that the agent
/// cannot do without answer to this user. Starts and changes nothing.
Findings checkServices();

} // namespace velk::check
