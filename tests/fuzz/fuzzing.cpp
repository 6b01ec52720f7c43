#include "fuzzing.h"

#include <QCoreApplication>
#include <QEvent>

#include <cstdint>
#include <cstdlib>
#include <iostream>

namespace {

/// The agent has made the text of its line, and that is all that matters here.
void dropLine(QtMsgType, const QMessageLogContext&, const QString&) { }

} // namespace

void require(bool condition, const char* what)
{
    if (!condition) {
        std::cerr << "not so: " << what << std::endl;
        std::abort();
    }
}

// The names are AddressSanitizer's. Whole stacks cost time, but without them the suppression could not see
// who allocated.
extern "C" const char*
__asan_default_options() // NOLINT(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)
{
    return "fast_unwind_on_malloc=0";
}

// Where a key occurs twice in an object, the JSON parser of Qt 5.15 loses the list or object of the first.
extern "C" const char*
__lsan_default_suppressions() // NOLINT(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)
{
    return "leak:QJsonDocument::fromJson\n";
}

// The names are libFuzzer's, and so are the types.
// NOLINTNEXTLINE(readability-non-const-parameter)
extern "C" int LLVMFuzzerInitialize(int* argc, char*** argv)
{
    // The targets write over the daemon's files and the package tools.
    require(qEnvironmentVariableIsSet("VELK_BOX_USER"), "runs in the simulated terminal (sandbox/in-box)");
    qInstallMessageHandler(dropLine);
    [[maybe_unused]] static auto* const application = new QCoreApplication(*argc, *argv);
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    tryInput(QByteArray(reinterpret_cast<const char*>(data), static_cast<int>(size)));
    QCoreApplication::processEvents();
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    return 0;
}
