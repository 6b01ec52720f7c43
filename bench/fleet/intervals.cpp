/// Prints the poll intervals that the agent draws at each second of a day, in milliseconds: the first one
/// after a start, and a later one.

#include <QCoreApplication>

#include <sys/time.h>

#include <cstdio>

#include "message_platform.h"

namespace {

constexpr int kSecondsOfDay = 24 * 60 * 60;
// NOLINTNEXTLINE(cppcoreguidelines-avoid-non-const-global-variables): the clock below takes no other argument
int second = 0;

} // namespace

/// The clock that Qt reads, in place of the C library's.
// NOLINTNEXTLINE(readability-inconsistent-declaration-parameter-name): the header's are reserved
extern "C" int gettimeofday(timeval* now, void* /*zone*/) noexcept
{
    *now = {second, 0};
    return 0;
}

int main(int argc, char* argv[])
{
    qputenv("TZ", "UTC");
    const QCoreApplication application(argc, argv);
    MessagePlatform platform(nullptr, QString(), nullptr);
    for (second = 0; second < kSecondsOfDay; ++second) {
        const int first = platform.generateRandnum(kLongestFirstPollInterval, kShortestPollInterval);
        const int later = platform.generateRandnum(kLongestPollInterval, kShortestPollInterval);
        std::printf("%d %d\n", first, later);
    }
    return 0;
}
