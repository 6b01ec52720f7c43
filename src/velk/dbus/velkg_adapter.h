#pragma once

#include <QDBusAbstractAdaptor>

#include "velkg_introspection.h"

/// Exports the system daemon's interface from its parent: a call invokes the parent's invokable method of the
/// same name, and the parent's signals of the same name are sent on the bus. If the parent lacks the method,
/// the answer is 0, an empty text or nothing. The mixed case of the names is that of the wire.
class velkgAdapter : public QDBusAbstractAdaptor
{
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", VELKG_INTERFACE_NAME)
    Q_CLASSINFO("D-Bus Introspection", VELKG_INTROSPECTION)

public:
    static const char* staticInterfaceName() { return VELKG_INTERFACE_NAME; }

    explicit velkgAdapter(QObject* parent);

public Q_SLOTS:
    int GetDomainStatus();
    QString GetMachineID();
    int GetNetStatus();
    int GetPolicyPullTime();
    QString GetServerIP();
    QString GetServerPort();
    void SendUserStatus(int type, const QString& userName);
    void UpdateUserInfo(const QString& name, int id);
    int onDomainConfig(const QString& type);
    void onPolicyFinished(int taskID, int jobID, int code, const QString& ack);
    void onUploadFinished(const QString& url, const QString& data);
    void sendAppOpenState(int type, const QString& appName);

Q_SIGNALS:
    void pushOnlineMsg();
    void pushPolicyMsg(const QString& appID, const QString& payload);
    void requestSendAppOpenState(int type, const QString& appName);
    void requestSetStoragePerm(int type, int mode);
};
