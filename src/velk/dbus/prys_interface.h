#pragma once

#include "prys_introspection.h"
#include "unread_calls.h"

#include <QDBusAbstractInterface>
#include <QDBusPendingReply>

/// Proxy of the session policy service's interface, on the session bus.
///
/// The slot sends its call at once and does not wait; a caller that drops the pending reply drops the call's
/// error with it, as when the service is absent. No number of calls is too many for the bus: behind 64 that
/// the service has not answered yet, and for a text of more than 65,536 characters, the call goes out without
/// asking for a reply. Its pending reply is finished at once and is no error, whatever becomes of the call.
class prysInterface : public QDBusAbstractInterface
{
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", PRYS_INTERFACE_NAME)
    Q_CLASSINFO("D-Bus Introspection", PRYS_INTROSPECTION)

public:
    static const char* staticInterfaceName() { return PRYS_INTERFACE_NAME; }

    prysInterface(const QString& service, const QString& path, const QDBusConnection& connection,
                  QObject* parent = nullptr);

public Q_SLOTS:
    QDBusPendingReply<> onPolicyMsg(const QString& payload);

private:
    UnreadCalls m_unreadCalls;
};
