#pragma once

#include <QDBusAbstractInterface>
#include <QDBusPendingReply>

#include "prys_introspection.h"
#include "unread_calls.h"

/// Proxy of the session policy service's interface, on the session bus.
///
/// The slot sends its call at once and does not wait. A caller that drops the pending reply ignores errors,
/// such as an absent service. The bus never refuses a call, however many are sent: with more than 65,536
/// characters, or while 64 are unanswered, a call is sent without asking for a reply. Its pending reply is
/// finished at once and is never an error.
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
