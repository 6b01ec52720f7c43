#include "pretended_time.h"

#include <sys/time.h>

std::optional<time_t>& pretendedTime()
{
    static std::optional<time_t> time;
    return time;
}

/// Replaces the C library's.
// The header's names of the parameters are reserved.
// NOLINTNEXTLINE(readability-inconsistent-declaration-parameter-name)
int gettimeofday(timeval* now, void* /*zone*/) noexcept
{
    timespec clock{};
    static_cast<void>(clock_gettime(CLOCK_REALTIME, &clock)); // this clock always exists
    *now = {pretendedTime().value_or(clock.tv_sec), clock.tv_nsec / 1000};
    return 0;
}
