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
        std::cerr << "not so: " << what << '\n' << std::flush;
        std::abort();
    }
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
