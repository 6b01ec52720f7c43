#include "dock.h"

#include <QDBusArgument>

#include "remote_object.h"

__Dock::__Dock(const QString& service, const QString& path, const QDBusConnection& connection,
               QObject* parent)
    : QDBusAbstractInterface(service, path, staticInterfaceName(), connection, parent)
{ }

QList<QDBusObjectPath> __Dock::entries() const
{
    const auto argument = desktopproxies::RemoteObject{connection(), service(), path(), interface()}
                              .read(QStringLiteral("Entries"))
                              .value<QDBusArgument>();
    if (argument.currentSignature() != QLatin1String("ao")) {
        return {};
    }
    return qdbus_cast<QList<QDBusObjectPath>>(argument);
}
