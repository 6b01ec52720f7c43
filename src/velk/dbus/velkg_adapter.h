#pragma once

#include "velkg_introspection.h"

#include <QDBusAbstractAdaptor>

/// Exports the system daemon's interface from its parent: a call goes to the parent's invokable method of the
/// same name, a signal of the parent of the same name goes out on the bus. A parent without the method
/// answers 0, an empty text or nothing. The mixed case of the names is what is on the wire.
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
