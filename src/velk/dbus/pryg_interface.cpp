#include "pryg_interface.h"

prygInterface::prygInterface(const QString& service, const QString& path, const QDBusConnection& connection,
                             QObject* parent)
    : QDBusAbstractInterface(service, path, staticInterfaceName(), connection, parent)
{ }

QDBusPendingReply<> prygInterface::PullAndExeSysPolicy()
{
    return asyncCallWithArgumentList(QStringLiteral("PullAndExeSysPolicy"), {});
}

QDBusPendingReply<> prygInterface::onPolicyMsg(const QString& payload)
{
    return asyncCallWithArgumentList(QStringLiteral("onPolicyMsg"), {QVariant(payload)});
}
