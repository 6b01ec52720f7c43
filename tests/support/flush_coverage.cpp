// Linked into the agent of a coverage build, and only there: the tests end the agent by a signal, which would
// lose its counters.

#include <csignal>

extern "C" void __gcov_dump(); // NOLINT(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)

namespace {

void flushAndEnd(int signal)
{
    __gcov_dump();
    std::signal(signal, SIG_DFL);
    std::raise(signal);
}

[[maybe_unused]] const auto previous = std::signal(SIGTERM, flushAndEnd);

} // namespace
