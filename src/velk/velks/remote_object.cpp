#include "remote_object.h"

#include <QDBusConnectionInterface>
#include <QDBusMessage>
#include <QDBusReply>
#include <QVector>

namespace {

/// Waits for a reply; its value is invalid if it is an error.
QVariant valueOf(QDBusPendingReply<QDBusVariant> reply)
{
    reply.waitForFinished();
    return reply.isError() ? QVariant() : reply.value().variant();
}

} // namespace

bool isOnBus(const QDBusConnection& bus, const QString& service)
{
    // The bus interface is null if the connection to the bus was never made.
    const auto* busInterface = bus.interface();
    return busInterface != nullptr && busInterface->isServiceRegistered(service);
}

RemoteObject::RemoteObject(const QDBusConnection& bus, const QString& service, const QString& path,
                           const QString& interface)
    : m_bus(bus)
    , m_service(service)
    , m_path(path)
    , m_interface(interface)
{ }

QVariant RemoteObject::property(const QString& name) const
{
    return valueOf(ask(name));
}

std::optional<QVariant> RemoteObject::propertyIfPresent(const QString& name) const
{
    QVariant value = property(name);
    if (!value.isValid() && !isOnBus(m_bus, m_service)) {
        return {};
    }
    return value;
}

QVariantList RemoteObject::properties(const QStringList& names) const
{
    QVector<QDBusPendingReply<QDBusVariant>> replies;
    for (const QString& name : names) {
        replies.append(ask(name));
    }

    QVariantList values;
    for (const auto& reply : replies) {
        values.append(valueOf(reply));
    }
    return values;
}

QDBusPendingReply<QDBusVariant> RemoteObject::ask(const QString& name) const
{
    return m_bus.asyncCall(propertiesCall(QStringLiteral("Get"), {m_interface, name}));
}

void RemoteObject::setProperty(const QString& name, const QVariant& value) const
{
    const QVariant boxed = QVariant::fromValue(QDBusVariant(value));
    m_bus.asyncCall(propertiesCall(QStringLiteral("Set"), {m_interface, name, boxed}));
}

QDBusMessage RemoteObject::propertiesCall(const QString& method, const QVariantList& arguments) const
{
    auto call = QDBusMessage::createMethodCall(m_service, m_path,
                                               QStringLiteral("org.freedesktop.DBus.Properties"), method);
    call.setArguments(arguments);
    return call;
}
