#pragma once

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusReply>
#include <QDBusVariant>
#include <QString>
#include <QVariant>

/// Apart from what programs that link this library call by the same names.
namespace desktopproxies {

/// The D-Bus interface of every object's properties.
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

    /// Waits for a property's value, for the D-Bus time limit at most; an error if the service is absent,
    /// hangs or has no such object or property.
    QDBusReply<QDBusVariant> get(const QString& property) const;

    /// The same, with an invalid value in place of the error.
    QVariant read(const QString& property) const;
};

} // namespace desktopproxies
