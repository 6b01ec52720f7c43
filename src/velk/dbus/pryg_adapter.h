#pragma once

#include <QDBusAbstractAdaptor>

#include "pryg_introspection.h"

/// Exports the device-control policy service's interface from its parent: a call invokes the parent's
/// invokable method of the same name, and does nothing if the parent lacks it; the parent's signals of the
/// same name are sent on the bus. The mixed case of the names is that of the wire.
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
