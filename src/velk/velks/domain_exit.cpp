#include "domain_exit.h"

#include <QDBusConnection>
#include <QDebug>
#include <QProcess>
#include <QSettings>

#include <cstdlib>

#include "constants.h"
#include "libvelkkpx.h"
#include "remote_object.h"
#include "services.h"

void runRestoreScript()
{
    const QString script = velk::kScriptsPath + QStringLiteral("restore_config.bash");
    qInfo() << "onPolicyMsg"
            << "----strPath:" << script;
    QProcess bash;
    bash.setProcessChannelMode(QProcess::ForwardedChannels);
    // A script that reads its standard input must get end-of-file at once: if it waited, the reboot would
    // never come.
    bash.setStandardInputFile(QProcess::nullDevice());
    bash.start(QStringLiteral("bash"), {script});
    bash.waitForFinished(-1);
}

void restoreDesktop()
{
    QSettings backup(velk::kBackupConfigPath, QSettings::IniFormat);
    Libvelkkpx desktop;

    backup.beginGroup(QStringLiteral("config"));
    // The library expects one empty string in the second list.
    desktop.SetControlConfig(backup.value(QStringLiteral("ControlCenterList")).toStringList(), {QString()});
    backup.endGroup();

    desktop.SetHotspotEnable(1);
    desktop.SetShortcutKeyEnable(true);
    desktop.SetLauncherDisplayable(true);
    desktop.SetTaskbarRightclickMenuEnable(true);
    desktop.SetResidentTaskbarAppDisplayable(true);
    desktop.SetRecycleBinDisplayable(true);
    desktop.SetWebTrayIconClickable(true);
    desktop.SetUsbTrayIconClickable(true);

    // The exit status is ignored: the reboot that follows stops what systemctl could not. The command is
    // constant, so a shell cannot misread it.
    [[maybe_unused]] const int status = std::system("systemctl --global stop prys"); // NOLINT(cert-env33-c)
}

void switchIdentityServiceOff()
{
    const QString& service = velk::service::kIdentityService;
    RemoteObject(QDBusConnection::systemBus(), service, QStringLiteral("/com/norix/velk/iam"), service)
        .setProperty(QStringLiteral("Enable"), false);
}
