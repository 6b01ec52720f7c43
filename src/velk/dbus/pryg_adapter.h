#pragma once

#include "pryg_introspection.h"

#include <QDBusAbstractAdaptor>

/// Exports the device-control policy service's interface from its parent: a call goes to the parent's
/// invokable method of the same name, and has no effect on a parent without one; a signal of the parent of
/// the same name goes out on the bus. The mixed case of the names is what is on the wire.
class prygAdapter : public QDBusAbstractAdaptor
{
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", PRYG_INTERFACE_NAME)
    Q_CLASSINFO("D-Bus Introspection", PRYG_INTROSPECTION)

public:
    static const char* staticInterfaceName() { return PRYG_INTERFACE_NAME; }

    explicit prygAdapter(QObject* parent);

public Q_SLOTS:
    void PullAndExeSysPolicy();
    void onPolicyMsg(const QString& payload);

Q_SIGNALS:
    void NotifyReportConnInfo(const QString& usbName, const QString& vendorID, const QString& productID,
                              const QString& serial, const QString& status);
    void RequestShowNormalSysNotify(const QString& msg);
    void RequestShowUsbCtrlAuthorSysNotify(bool isAdd, const QString& devName);
    void notifyMsg(const QString& msg, int type);
};
