/// Floor of an inventory: the package tools that it needs, one after the other, and one call at the end.
/// usage: bench_inventory items|records COUNT

#include <QCoreApplication>
#include <QProcess>

#include "bare_proxies.h"

namespace {

QString package(int number)
{
    return QStringLiteral("package-%1").arg(number);
}

void run(const QString& program, const QStringList& arguments)
{
    QProcess process;
    process.start(program, arguments);
    process.waitForFinished(-1);
    process.readAllStandardOutput();
}

void lookUpVersion(const QString& name)
{
    run(QStringLiteral("/usr/bin/dpkg-query"),
        {QStringLiteral("-W"), QStringLiteral("-f='${Version}'"), name});
}

void lookUpItem(const QString& name)
{
    run(QStringLiteral("dpkg"),
        {QStringLiteral("-S"), QStringLiteral("/usr/share/applications/%1.desktop").arg(name)});
    lookUpVersion(name);
}

} // namespace

int main(int argc, char* argv[])
{
    const QCoreApplication application(argc, argv);
    const QStringList arguments = QCoreApplication::arguments();
    const bool forItems = arguments.value(1) == QLatin1String("items");
    const int count = arguments.value(2).toInt();
    BareDaemon daemon;

    run(QStringLiteral("/usr/bin/dpkg-architecture"),
        {QStringLiteral("-q"), QStringLiteral("DEB_HOST_ARCH_CPU")});
    for (int number = 0; number < count; ++number) {
        forItems ? lookUpItem(package(number)) : lookUpVersion(package(0));
    }
    daemon.call(QStringLiteral("onUploadFinished"), QString(), QString());
    return 0;
}
