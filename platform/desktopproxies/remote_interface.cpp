#include "remote_interface.h"

#include <QDBusReply>
#include <QDBusVariant>

QDBusMessage RemoteInterface::readCall(const QString& property) const
{
    auto call = QDBusMessage::createMethodCall(service, path, kPropertiesInterface, QStringLiteral("Get"));
    call << interface << property;
    return call;
}

QVariant RemoteInterface::read(const QString& property) const
{
    const QDBusReply<QDBusVariant> reply = bus.call(readCall(property));
    return reply.isValid() ? reply.value().variant() : QVariant();
}
