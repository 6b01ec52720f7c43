#include "package_tools.h"

#include <QProcess>

void runTool(const QString& program, const QStringList& arguments)
{
    QProcess process;
    process.start(program, arguments);
    process.waitForFinished(-1);
    process.readAllStandardOutput();
}

void askArchitecture()
{
    runTool(QStringLiteral("/usr/bin/dpkg-architecture"),
            {QStringLiteral("-q"), QStringLiteral("DEB_HOST_ARCH_CPU")});
}
