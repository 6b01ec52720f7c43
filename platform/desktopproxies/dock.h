#pragma once

#include <QDBusAbstractInterface>
#include <QDBusObjectPath>
#include <QList>

/// Proxy of the desktop's dock. It may be built before the dock is on the bus, and addresses the name's
/// current owner. The desktop's library gives its proxies names with underscores.
// NOLINTNEXTLINE(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)
class __Dock : public QDBusAbstractInterface
{
    Q_OBJECT

public:
    static const char* staticInterfaceName() { return "com.norix.kpx.daemon.Dock"; }

    __Dock(const QString& service, const QString& path, const QDBusConnection& connection,
           QObject* parent = nullptr);

    /// The entries' objects, in the dock's order, read now; empty if the dock does not answer.
    QList<QDBusObjectPath> entries() const;

Q_SIGNALS:
    void EntryAdded(const QDBusObjectPath& path, int index);
    void EntryRemoved(const QString& id);
};
