#include "pretended.h"

#include <sys/time.h>
#include <unistd.h>

std::optional<time_t>& pretendedTime()
{
    static std::optional<time_t> time;
    return time;
}

std::optional<uid_t>& pretendedUid()
{
    static std::optional<uid_t> uid;
    return uid;
}

// These replace the C library's.

// The header's names of the parameters are reserved.
// NOLINTNEXTLINE(readability-inconsistent-declaration-parameter-name)
int gettimeofday(timeval* now, void* /*zone*/) noexcept
{
    timespec clock{};
    static_cast<void>(clock_gettime(CLOCK_REALTIME, &clock)); // this clock always exists
    *now = {pretendedTime().value_or(clock.tv_sec), clock.tv_nsec / 1000};
    return 0;
}

uid_t getuid() noexcept
{
    return pretendedUid().value_or(geteuid());
}
