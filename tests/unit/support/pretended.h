#pragma once

#include <sys/types.h>

#include <ctime>
#include <optional>

/// The time of day that Qt reads instead of the clock's, in seconds since the epoch.
std::optional<time_t>& pretendedTime();

/// What getuid() answers instead of the program's own uid.
std::optional<uid_t>& pretendedUid();
