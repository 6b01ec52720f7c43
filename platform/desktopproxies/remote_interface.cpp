#include "remote_interface.h"

QDBusMessage RemoteInterface::readCall(const QString& property) const
{
    auto call = QDBusMessage::createMethodCall(service, path, kPropertiesInterface, QStringLiteral("Get"));
    call << interface << property;
    return call;
}

QDBusReply<QDBusVariant> RemoteInterface::get(const QString& property) const
{
    return bus.call(readCall(property));
}

QVariant RemoteInterface::read(const QString& property) const
{
    const QDBusReply<QDBusVariant> reply = get(property);
    return reply.isValid() ? reply.value().variant() : QVariant();
}
