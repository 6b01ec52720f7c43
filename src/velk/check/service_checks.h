#pragma once

#include "finding.h"

namespace velk::check {

/// The services that the agent speaks with: whether they are on their buses now, and whether those without
/// which the agent is of no use answer to this user. None is started, and nothing is changed.
Findings checkServices();

} // namespace velk::check
