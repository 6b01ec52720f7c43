#pragma once

#include <QDBusAbstractInterface>
#include <QDBusPendingReply>

#include "unread_calls.h"
#include "velkg_introspection.h"

/// Proxy of the system daemon's interface, on the system bus.
///
/// Each slot sends its call at once and does not wait. A caller that reads the value blocks until the reply
/// arrives, for D-Bus's default time limit at most, and must check isError() first: Qt returns the error text
/// of a failed call as the value of a text. The proxy may be built before the daemon is on the bus; it
/// addresses the name's current owner. The mixed case of the names is that of the wire.
///
/// A caller that drops the pending reply ignores errors. The bus never refuses a call without a value
/// (QDBusPendingReply<>), however many are sent: with more than 65,536 characters, or while 64 are
/// unanswered, it is sent without asking for a reply. Its pending reply is finished at once and is never an
/// error.
class velkgInterface : public QDBusAbstractInterface
{
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", VELKG_INTERFACE_NAME)
    Q_CLASSINFO("D-Bus Introspection", VELKG_INTROSPECTION)

public:
    static const char* staticInterfaceName() { return VELKG_INTERFACE_NAME; }

    velkgInterface(const QString& service, const QString& path, const QDBusConnection& connection,
                   QObject* parent = nullptr);

public Q_SLOTS:
    QDBusPendingReply<int> GetDomainStatus();
    QDBusPendingReply<QString> GetMachineID();
    QDBusPendingReply<int> GetNetStatus();
    QDBusPendingReply<int> GetPolicyPullTime();
    QDBusPendingReply<QString> GetServerIP();
    QDBusPendingReply<QString> GetServerPort();
    QDBusPendingReply<> SendUserStatus(int type, const QString& userName);
    QDBusPendingReply<> UpdateUserInfo(const QString& name, int id);
    QDBusPendingReply<int> onDomainConfig(const QString& type);
    QDBusPendingReply<> onPolicyFinished(int taskID, int jobID, int code, const QString& ack);
    QDBusPendingReply<> onUploadFinished(const QString& url, const QString& data);
    QDBusPendingReply<> sendAppOpenState(int type, const QString& appName);

Q_SIGNALS:
    void pushOnlineMsg();
    void pushPolicyMsg(const QString& appID, const QString& payload);
    void requestSendAppOpenState(int type, const QString& appName);
    void requestSetStoragePerm(int type, int mode);

private:
    UnreadCalls m_unreadCalls;
};
