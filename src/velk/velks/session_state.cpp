#include "session_state.h"

#include <QDBusConnection>
#include <QDebug>

#include "remote_object.h"
#include "services.h"
#include "session_user.h"

namespace {

RemoteObject loginManagersUser()
{
    return {QDBusConnection::systemBus(), velk::service::kLoginManager,
            QStringLiteral("/org/freedesktop/login1/user/self"),
            QStringLiteral("org.freedesktop.login1.User")};
}

} // namespace

LoginUser loginUser()
{
    const QVariantList values =
        loginManagersUser().properties({QStringLiteral("Name"), QStringLiteral("UID")});
    return {daemonUserName(values.at(0).toString()), values.at(1).toInt()};
}

QString loginUserName()
{
    return daemonUserName(loginManagersUser().property(QStringLiteral("Name")).toString());
}

bool isScreenSaverRunning()
{
    const RemoteObject screenSaver(QDBusConnection::sessionBus(), velk::service::kScreenSaver,
                                   QStringLiteral("/com/norix/ScreenSaver"), velk::service::kScreenSaver);
    const std::optional<QVariant> running = screenSaver.propertyIfPresent(QStringLiteral("isRunning"));
    if (!running) {
        return false;
    }
    qDebug() << "get screenSaver state " << running->toBool();
    return running->toBool();
}

bool isScreenLocked()
{
    const RemoteObject sessionManager(QDBusConnection::sessionBus(), velk::service::kSessionManager,
                                      QStringLiteral("/com/norix/SessionManager"),
                                      velk::service::kSessionManager);
    const std::optional<QVariant> locked = sessionManager.propertyIfPresent(QStringLiteral("Locked"));
    if (!locked) {
        return false;
    }
    qDebug() << "get screenLocked state " << locked->toBool();
    return locked->toBool();
}
