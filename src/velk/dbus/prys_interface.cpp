#include "prys_interface.h"

prysInterface::prysInterface(const QString& service, const QString& path, const QDBusConnection& connection,
                             QObject* parent)
    : QDBusAbstractInterface(service, path, staticInterfaceName(), connection, parent)
{ }

QDBusPendingReply<> prysInterface::onPolicyMsg(const QString& payload)
{
    return m_unreadCalls.send(*this, QStringLiteral("onPolicyMsg"), {QVariant(payload)});
}
