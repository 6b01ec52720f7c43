#include "remote_object.h"

namespace desktopproxies {

QDBusMessage RemoteObject::readCall(const QString& property) const
{
    auto call = QDBusMessage::createMethodCall(service, path, kPropertiesInterface, QStringLiteral("Get"));
    call << interface << property;
    return call;
}

QDBusReply<QDBusVariant> RemoteObject::get(const QString& property) const
{
    return bus.call(readCall(property));
}

QVariant RemoteObject::read(const QString& property) const
{
    const QDBusReply<QDBusVariant> reply = get(property);
    return reply.isValid() ? reply.value().variant() : QVariant();
}

} // namespace desktopproxies
