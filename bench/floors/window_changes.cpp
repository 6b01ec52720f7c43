#include "window_changes.h"

#include <QDBusArgument>
#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusVariant>

#include "bare_proxies.h"

WindowChanges::WindowChanges(BareDaemon& daemon)
    : m_daemon(daemon)
{
    QDBusConnection::sessionBus().connect(QStringLiteral("com.norix.kpx.daemon.Dock"), QString(),
                                          QStringLiteral("org.freedesktop.DBus.Properties"),
                                          QStringLiteral("PropertiesChanged"), this,
                                          SLOT(onChanged(QDBusMessage)));
}

void WindowChanges::onChanged(const QDBusMessage& signal)
{
    const auto changed = qdbus_cast<QVariantMap>(signal.arguments().value(1));
    const auto windows = qdbus_cast<QMap<uint, QDBusVariant>>(changed.value(QStringLiteral("WindowInfos")));
    m_daemon.asyncCall(QStringLiteral("sendAppOpenState"), windows.isEmpty() ? 2 : 1, signal.path());
}
