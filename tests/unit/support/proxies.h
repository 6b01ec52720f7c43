#pragma once

#include <QMetaMethod>

#include "pryg_interface.h"
#include "prys_interface.h"
#include "velkg_interface.h"

/// The three proxies, all of one object of one service.
struct Proxies
{
    Proxies(const QString& service, const QString& path, const QDBusConnection& bus)
        : velkg(service, path, bus)
        , pryg(service, path, bus)
        , prys(service, path, bus)
    { }

    QDBusAbstractInterface& of(const QString& interface)
    {
        if (interface == velkg.interface()) {
            return velkg;
        }
        return interface == pryg.interface() ? static_cast<QDBusAbstractInterface&>(pryg) : prys;
    }

    velkgInterface velkg;
    prygInterface pryg;
    prysInterface prys;
};

/// The object's signal of that name, for a QSignalSpy; invalid when it has none.
inline QMetaMethod signalNamed(const QObject& object, const QString& name)
{
    const QMetaObject& meta = *object.metaObject();
    for (int i = meta.methodOffset(); i < meta.methodCount(); ++i) {
        const QMetaMethod method = meta.method(i);
        if (method.methodType() == QMetaMethod::Signal && method.name() == name.toLatin1()) {
            return method;
        }
    }
    return {};
}
