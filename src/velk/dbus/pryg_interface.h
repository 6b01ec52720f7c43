#pragma once

#include <QDBusAbstractInterface>
#include <QDBusPendingReply>

#include "pryg_introspection.h"

/// Proxy of the device-control policy service's interface. Each slot sends its call at once and does not
/// wait; a caller that drops the pending reply ignores errors. The mixed case of the names is that of the
/// wire.
class prygInterface : public QDBusAbstractInterface
{
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", PRYG_INTERFACE_NAME)
    Q_CLASSINFO("D-Bus Introspection", PRYG_INTROSPECTION)

public:
    static const char* staticInterfaceName() { return PRYG_INTERFACE_NAME; }

    prygInterface(const QString& service, const QString& path, const QDBusConnection& connection,
                  QObject* parent = nullptr);

public Q_SLOTS:
    QDBusPendingReply<> PullAndExeSysPolicy();
    QDBusPendingReply<> onPolicyMsg(const QString& payload);

Q_SIGNALS:
    void NotifyReportConnInfo(const QString& usbName, const QString& vendorID, const QString& productID,
                              const QString& serial, const QString& status);
    void RequestShowNormalSysNotify(const QString& msg);
    void RequestShowUsbCtrlAuthorSysNotify(bool isAdd, const QString& devName);
    void notifyMsg(const QString& msg, int type);
};
