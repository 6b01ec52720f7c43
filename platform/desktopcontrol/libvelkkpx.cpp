#include "libvelkkpx.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QMap>
#include <QSettings>
#include <QStandardPaths>
#include <QVariant>
#include <QtDebug>

namespace {

/// Calls a method of the login manager with a plain message: a proxy object would first introspect the
/// service, and wait twice for one that hangs.
void callLoginManager(const QString& path, const QString& interface, const QString& method,
                      const QVariantList& arguments)
{
    QDBusMessage call =
        QDBusMessage::createMethodCall(QStringLiteral("org.freedesktop.login1"), path, interface, method);
    call.setArguments(arguments);
    const QDBusMessage answer = QDBusConnection::systemBus().call(call);
    if (answer.type() == QDBusMessage::ErrorMessage) {
        qWarning("cannot call %s: %s", qUtf8Printable(method), qUtf8Printable(answer.errorMessage()));
    }
}

/// Returns an empty string, or the text of the error.
QString store(const QMap<QString, QVariant>& switches)
{
    const QString path = QStandardPaths::writableLocation(QStandardPaths::GenericConfigLocation)
        + QStringLiteral("/norix/desktop-control.ini");
    QSettings file(path, QSettings::IniFormat);
    file.beginGroup(QStringLiteral("restrictions"));
    for (auto entry = switches.cbegin(); entry != switches.cend(); ++entry) {
        file.setValue(entry.key(), entry.value());
    }
    file.sync();

    if (file.status() == QSettings::FormatError) {
        return QStringLiteral("lines that are not INI are lost from ") + path;
    }
    return file.status() == QSettings::NoError ? QString() : QStringLiteral("cannot write ") + path;
}

void warnOf(const QString& error)
{
    if (!error.isEmpty()) {
        qWarning("%s", qUtf8Printable(error));
    }
}

} // namespace

void Libvelkkpx::Reboot()
{
    const bool interactive = false; // no password dialog
    callLoginManager(QStringLiteral("/org/freedesktop/login1"),
                     QStringLiteral("org.freedesktop.login1.Manager"), QStringLiteral("Reboot"),
                     {interactive});
}

void Libvelkkpx::Logout()
{
    callLoginManager(QStringLiteral("/org/freedesktop/login1/session/auto"),
                     QStringLiteral("org.freedesktop.login1.Session"), QStringLiteral("Terminate"), {});
}

void Libvelkkpx::SetControlConfig(const QStringList& modules, const QStringList& extra)
{
    warnOf(store(
        {{QStringLiteral("ControlCenterList"), modules}, {QStringLiteral("ControlCenterExtra"), extra}}));
}

void Libvelkkpx::SetHotspotEnable(int enable)
{
    warnOf(store({{QStringLiteral("HotspotEnable"), enable}}));
}

QString Libvelkkpx::SetShortcutKeyEnable(bool enable)
{
    return store({{QStringLiteral("ShortcutKeyEnable"), enable}});
}

QString Libvelkkpx::SetLauncherDisplayable(bool displayable)
{
    return store({{QStringLiteral("LauncherDisplayable"), displayable}});
}

QString Libvelkkpx::SetTaskbarRightclickMenuEnable(bool enable)
{
    return store({{QStringLiteral("TaskbarRightclickMenuEnable"), enable}});
}

QString Libvelkkpx::SetResidentTaskbarAppDisplayable(bool displayable)
{
    return store({{QStringLiteral("ResidentTaskbarAppDisplayable"), displayable}});
}

QString Libvelkkpx::SetRecycleBinDisplayable(bool displayable)
{
    return store({{QStringLiteral("RecycleBinDisplayable"), displayable}});
}

QString Libvelkkpx::SetWebTrayIconClickable(bool clickable)
{
    return store({{QStringLiteral("WebTrayIconClickable"), clickable}});
}

QString Libvelkkpx::SetUsbTrayIconClickable(bool clickable)
{
    return store({{QStringLiteral("UsbTrayIconClickable"), clickable}});
}
