#pragma once

#include <ctime>
#include <optional>

/// The time of day that Qt reads instead of the clock's, in seconds since the epoch.
std::optional<time_t>& pretendedTime();
