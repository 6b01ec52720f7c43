#pragma once

#include "unread_calls.h"
#include "velkg_introspection.h"

#include <QDBusAbstractInterface>
#include <QDBusPendingReply>

/// Proxy of the system daemon's interface, on the system bus.
///
/// Each slot sends its call at once and does not wait. A caller that reads the value blocks until the reply
/// is there, for D-Bus's default time at most, and asks isError() first: Qt hands out a failed call's error
/// text as the value of a text. The proxy may be built before the daemon is on the bus: it serves whichever
/// daemon owns the name at the moment. The mixed case of the names is what is on the wire.
///
/// A caller that drops the pending reply drops the call's error with it. No number of calls without a value
/// (QDBusPendingReply<>) is too many for the bus: behind 64 of them that the daemon has not answered yet, and
/// with texts of more than 65,536 characters, such a call goes out without asking for a reply. Its pending
/// reply is finished at once and is no error, whatever becomes of the call.
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
