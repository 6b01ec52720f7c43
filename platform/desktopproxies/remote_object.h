#pragma once

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusReply>
#include <QDBusVariant>
#include <QString>
#include <QVariant>

/// In a namespace: programs that link this library have a class of the same name.
namespace desktopproxies {

/// The standard D-Bus interface for properties.
inline const QString kPropertiesInterface = QStringLiteral("org.freedesktop.DBus.Properties");

/// One interface of one object of a service.
struct RemoteObject
{
    QDBusConnection bus;
    QString service;
    QString path;
    QString interface;

    /// The call that reads a property.
    QDBusMessage readCall(const QString& property) const;

    /// Waits for a property's value, for the D-Bus time limit at most; an error if the service is absent or
    /// hangs, or lacks the object or the property.
    QDBusReply<QDBusVariant> get(const QString& property) const;

    /// Like get(), but an invalid value instead of the error.
    QVariant read(const QString& property) const;
};

} // namespace desktopproxies
