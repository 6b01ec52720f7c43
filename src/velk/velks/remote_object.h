#pragma once

#include <QDBusConnection>
#include <QDBusPendingReply>
#include <QDBusVariant>
#include <QString>
#include <QStringList>
#include <QVariant>

#include <optional>

/// Whether a name has an owner now. Asks only the bus, never the service.
bool isOnBus(const QDBusConnection& bus, const QString& service);

/// The properties of one object of another service. It is reached without introspection, so a service that
/// introspects badly can still be read and written, and a service that hangs costs one D-Bus time limit
/// (25 s) per read and nothing else.
class RemoteObject
{
public:
    RemoteObject(const QDBusConnection& bus, const QString& service, const QString& path,
                 const QString& interface);

    /// Waits for the value. Invalid if the service is absent, hangs, fails or has no such property.
    QVariant property(const QString& name) const;

    /// As property(), but nothing if no such service is on the bus and none could be started. A service that
    /// D-Bus knows how to start is started by the reading.
    std::optional<QVariant> propertyIfPresent(const QString& name) const;

    /// The values of several properties, in the order of the names. They are asked for together, so that
    /// a service that hangs costs the time limit once for all of them.
    QVariantList properties(const QStringList& names) const;

    /// Sends the value and does not wait: failures are not seen.
    void setProperty(const QString& name, const QVariant& value) const;

private:
    QDBusPendingReply<QDBusVariant> ask(const QString& name) const;
    QDBusMessage propertiesCall(const QString& method, const QVariantList& arguments) const;

    QDBusConnection m_bus;
    QString m_service;
    QString m_path;
    QString m_interface;
};
