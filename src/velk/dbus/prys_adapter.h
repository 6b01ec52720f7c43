#pragma once

#include "prys_introspection.h"

#include <QDBusAbstractAdaptor>

/// Exports the session policy service's interface from its parent: the call goes to the parent's invokable
/// method of the same name, and has no effect on a parent without one.
class prysAdapter : public QDBusAbstractAdaptor
{
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", PRYS_INTERFACE_NAME)
    Q_CLASSINFO("D-Bus Introspection", PRYS_INTROSPECTION)

public:
    static const char* staticInterfaceName() { return PRYS_INTERFACE_NAME; }

    explicit prysAdapter(QObject* parent);

public Q_SLOTS:
    void onPolicyMsg(const QString& payload);
};
