#include "session_state.h"

#include <QDBusConnection>
#include <QDebug>

#include "remote_object.h"

namespace {

RemoteObject loginManagersUser()
{
    return {QDBusConnection::systemBus(), QStringLiteral("org.freedesktop.login1"),
            QStringLiteral("/org/freedesktop/login1/user/self"),
            QStringLiteral("org.freedesktop.login1.User")};
}

/// A domain login name may carry "@" anywhere; the daemon knows users without it.
QString daemonUserName(const QVariant& loginName)
{
    return loginName.toString().remove(QLatin1Char('@'));
}

} // namespace

LoginUser loginUser()
{
    const QVariantList values =
        loginManagersUser().properties({QStringLiteral("Name"), QStringLiteral("UID")});
    return {daemonUserName(values.at(0)), values.at(1).toInt()};
}

QString loginUserName()
{
    return daemonUserName(loginManagersUser().property(QStringLiteral("Name")));
}

bool isScreenSaverRunning()
{
    const RemoteObject screenSaver(QDBusConnection::sessionBus(), QStringLiteral("com.norix.ScreenSaver"),
                                   QStringLiteral("/com/norix/ScreenSaver"),
                                   QStringLiteral("com.norix.ScreenSaver"));
    const std::optional<QVariant> running = screenSaver.propertyIfPresent(QStringLiteral("isRunning"));
    if (!running) {
        return false;
    }
    qDebug() << "get screenSaver state " << running->toBool();
    return running->toBool();
}

bool isScreenLocked()
{
    const RemoteObject sessionManager(
        QDBusConnection::sessionBus(), QStringLiteral("com.norix.SessionManager"),
        QStringLiteral("/com/norix/SessionManager"), QStringLiteral("com.norix.SessionManager"));
    const std::optional<QVariant> locked = sessionManager.propertyIfPresent(QStringLiteral("Locked"));
    if (!locked) {
        return false;
    }
    qDebug() << "get screenLocked state " << locked->toBool();
    return locked->toBool();
}
