/// Floor of an inventory: the package tools that it needs, one after the other, and one call at the end.
/// usage: bench_inventory items|records COUNT, or bench_inventory changes COUNT ITEMS

#include <QCoreApplication>

#include "bare_proxies.h"
#include "package_tools.h"

namespace {

QString package(int number)
{
    return QStringLiteral("package-%1").arg(number);
}

void lookUpVersion(const QString& name)
{
    runTool(QStringLiteral("/usr/bin/dpkg-query"),
            {QStringLiteral("-W"), QStringLiteral("-f='${Version}'"), name});
}

void lookUpItem(const QString& name)
{
    runTool(QStringLiteral("dpkg"),
            {QStringLiteral("-S"), QStringLiteral("/usr/share/applications/%1.desktop").arg(name)});
    lookUpVersion(name);
}

void lookUpItems(int count)
{
    askArchitecture();
    for (int number = 0; number < count; ++number) {
        lookUpItem(package(number));
    }
}

/// Of each change its own item is looked up, then all of them.
void lookUpChanges(int count, int items)
{
    for (int change = 0; change < count; ++change) {
        lookUpItem(package(0));
        lookUpItems(items);
    }
}

void lookUpRecords(int count)
{
    askArchitecture();
    for (int number = 0; number < count; ++number) {
        lookUpVersion(package(0));
    }
}

} // namespace

int main(int argc, char* argv[])
{
    const QCoreApplication application(argc, argv);
    const QStringList arguments = QCoreApplication::arguments();
    const QString what = arguments.value(1);
    const int count = arguments.value(2).toInt();
    BareDaemon daemon;

    if (what == QLatin1String("items")) {
        lookUpItems(count);
    } else if (what == QLatin1String("changes")) {
        lookUpChanges(count, arguments.value(3).toInt());
    } else {
        lookUpRecords(count);
    }
    daemon.call(QStringLiteral("onUploadFinished"), QString(), QString());
    return 0;
}
