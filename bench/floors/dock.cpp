/// Floor of the dock: bare property reads of its entries, then one call for each change of windows.

#include <QCoreApplication>
#include <QDBusArgument>
#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusObjectPath>
#include <QDBusVariant>

#include "bare_proxies.h"
#include "window_changes.h"

namespace {

const QString kService = QStringLiteral("com.norix.kpx.daemon.Dock");
const QString kEntry = QStringLiteral("com.norix.kpx.daemon.Dock.Entry");
const QString kProperties = QStringLiteral("org.freedesktop.DBus.Properties");

QVariant read(const QString& path, const QString& interface, const QString& property)
{
    auto call = QDBusMessage::createMethodCall(kService, path, kProperties, QStringLiteral("Get"));
    call.setArguments({interface, property});
    return QDBusConnection::sessionBus().call(call).arguments().value(0).value<QDBusVariant>().variant();
}

void readEntries()
{
    const QVariant entries =
        read(QStringLiteral("/com/norix/kpx/daemon/Dock"), kService, QStringLiteral("Entries"));
    const auto paths = qdbus_cast<QList<QDBusObjectPath>>(entries.value<QDBusArgument>());
    for (const auto& path : paths) {
        for (const auto& property : {QStringLiteral("Id"), QStringLiteral("Name"),
                                     QStringLiteral("WindowInfos"), QStringLiteral("IsDocked")}) {
            read(path.path(), kEntry, property);
        }
    }
}

} // namespace

int main(int argc, char* argv[])
{
    const QCoreApplication application(argc, argv);
    BareDaemon daemon;
    const WindowChanges changes(daemon);
    readEntries();
    return QCoreApplication::exec();
}
