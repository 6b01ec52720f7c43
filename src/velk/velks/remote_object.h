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

/// The properties of one object of another service. Needs no introspection, so it works with a service that
/// introspects badly, and a hung service costs only one D-Bus time limit (25 s) per read.
class RemoteObject
{
public:
    RemoteObject(const QDBusConnection& bus, const QString& service, const QString& path,
                 const QString& interface);

    /// Waits for the value. Invalid if the service is absent, hangs, fails or lacks the property.
    QVariant property(const QString& name) const;

    /// Like property(), but nothing if the service is neither on the bus nor startable by D-Bus. Reading
    /// starts a startable service.
    std::optional<QVariant> propertyIfPresent(const QString& name) const;

    /// The values of several properties, in the order of the names. They are requested together, so a hung
    /// service costs the time limit only once.
    QVariantList properties(const QStringList& names) const;

    /// Sends the value and does not wait, so failures go unnoticed.
    void setProperty(const QString& name, const QVariant& value) const;

private:
    QDBusPendingReply<QDBusVariant> ask(const QString& name) const;
    QDBusMessage propertiesCall(const QString& method, const QVariantList& arguments) const;

    QDBusConnection m_bus;
    QString m_service;
    QString m_path;
    QString m_interface;
};
