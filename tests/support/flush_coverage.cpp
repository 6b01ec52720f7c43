// Linked into the agent of a coverage build, and only there: the tests end the agent by a signal, which would
// lose its counters.

#include <csignal>
#include <cstdlib>

extern "C" void __gcov_dump(); // NOLINT(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)

namespace {

void flushAndEnd(int signal)
{
    __gcov_dump();
    if (std::signal(signal, SIG_DFL) == SIG_ERR || std::raise(signal) != 0) {
        std::abort();
    }
}

[[maybe_unused]] const auto previous = std::signal(SIGTERM, flushAndEnd);

} // namespace
