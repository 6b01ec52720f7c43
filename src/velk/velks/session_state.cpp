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
    if (!screenSaver.isPresent()) {
        return false;
    }
    const bool running = screenSaver.property(QStringLiteral("isRunning")).toBool();
    qDebug() << "get screenSaver state " << running;
    return running;
}

bool isScreenLocked()
{
    const RemoteObject sessionManager(
        QDBusConnection::sessionBus(), QStringLiteral("com.norix.SessionManager"),
        QStringLiteral("/com/norix/SessionManager"), QStringLiteral("com.norix.SessionManager"));
    if (!sessionManager.isPresent()) {
        return false;
    }
    const bool locked = sessionManager.property(QStringLiteral("Locked")).toBool();
    qDebug() << "get screenLocked state " << locked;
    return locked;
}
