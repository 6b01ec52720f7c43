#include "remote_object.h"

#include <QDBusConnectionInterface>
#include <QDBusMessage>
#include <QDBusPendingReply>
#include <QDBusReply>
#include <QDBusVariant>
#include <QVector>

bool isOnBus(const QDBusConnection& bus, const QString& service)
{
    // There is no bus interface when the connection to the bus was never made.
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

bool RemoteObject::isPresent() const
{
    return isOnBus(m_bus, m_service);
}

QVariant RemoteObject::property(const QString& name) const
{
    return properties({name}).constFirst();
}

QVariantList RemoteObject::properties(const QStringList& names) const
{
    QVector<QDBusPendingReply<QDBusVariant>> replies;
    for (const QString& name : names) {
        replies.append(m_bus.asyncCall(propertiesCall(QStringLiteral("Get"), {m_interface, name})));
    }

    QVariantList values;
    for (auto& reply : replies) {
        reply.waitForFinished();
        values.append(reply.isError() ? QVariant() : reply.value().variant());
    }
    return values;
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
