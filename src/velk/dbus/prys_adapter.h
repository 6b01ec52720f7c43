#pragma once

#include <QDBusAbstractAdaptor>

#include "prys_introspection.h"

/// Exports the session policy service's interface from its parent: the call invokes the parent's invokable
/// method of the same name, and does nothing if the parent lacks it.
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
