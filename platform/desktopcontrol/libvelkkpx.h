#pragma once

#include <QObject>
#include <QString>
#include <QStringList>

/// Control of the user's desktop: ends the session or restarts the machine through the login manager, and
/// keeps the desktop's restriction switches.
///
/// The switches are in the user's configuration folder, norix/desktop-control.ini, group "restrictions", one
/// key per switch, written before the setter returns. Other content of the file is kept.
class Libvelkkpx : public QObject
{
    Q_OBJECT

public:
    using QObject::QObject;

    /// Both block until the login manager answers; a failure is logged as one warning.
    void Reboot();
    void Logout();

    /// The control center's module list and its additions. A failure is logged as one warning.
    void SetControlConfig(const QStringList& modules, const QStringList& extra);
    /// A failure is logged as one warning.
    void SetHotspotEnable(int enable);

    /// These return an empty string, or the text of the error.
    QString SetShortcutKeyEnable(bool enable);
    QString SetLauncherDisplayable(bool displayable);
    QString SetTaskbarRightclickMenuEnable(bool enable);
    QString SetResidentTaskbarAppDisplayable(bool displayable);
    QString SetRecycleBinDisplayable(bool displayable);
    QString SetWebTrayIconClickable(bool clickable);
    QString SetUsbTrayIconClickable(bool clickable);
};
