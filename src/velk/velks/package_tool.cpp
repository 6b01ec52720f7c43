#include "package_tool.h"

#include <QProcess>

#include <memory>

namespace {

constexpr int kTimeLimit = 30000; // ms, for the start and again for the end

/// A QProcess waits for its child when it is destroyed; this one is left to the event loop, which destroys it
/// when the child has ended.
void endWithoutWaiting(std::unique_ptr<QProcess> process)
{
    auto* running = process.release();
    QObject::connect(running, QOverload<int, QProcess::ExitStatus>::of(&QProcess::finished), running,
                     &QObject::deleteLater);
    running->kill();
}

} // namespace

PackageToolRun runPackageTool(const QString& program, const QStringList& arguments,
                              const QProcessEnvironment& environment)
{
    auto process = std::make_unique<QProcess>();
    process->setProcessEnvironment(environment);
    process->start(program, arguments);

    PackageToolRun run;
    run.ended = process->waitForStarted(kTimeLimit) && process->waitForFinished(kTimeLimit);
    run.output = QString::fromLocal8Bit(process->readAllStandardOutput());
    if (process->state() != QProcess::NotRunning) {
        endWithoutWaiting(std::move(process));
    }
    return run;
}
