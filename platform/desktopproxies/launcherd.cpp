#include "launcherd.h"

__Launcherd::__Launcherd(const QString& service, const QString& path, const QDBusConnection& connection,
                         QObject* parent)
    : QDBusAbstractInterface(service, path, staticInterfaceName(), connection, parent)
{ }

QDBusPendingReply<LauncherItemInfoList> __Launcherd::GetAllItemInfos()
{
    return asyncCallWithArgumentList(QStringLiteral("GetAllItemInfos"), {});
}
