#pragma once

#include <QJsonObject>
#include <QObject>
#include <QString>
#include <QStringList>

#include "session_policy.h"

class LauncherGuard;
class QTimer;
class prysInterface;
class velkgInterface;

/// The agent's centre: receives the daemon's signals, carries out the policies that concern this session,
/// forwards the others to the session policy service, and tells the daemon about the user, the session, the
/// applications and the software.
class MessageTransfer : public QObject
{
    Q_OBJECT

public:
    enum Screen_State {
        ScreenSaverRunning,
        ScreenLocked,
        ScreenActive,
    };

    /// Uploads the software inventory and announces the user and an active session to the daemon. Waits for
    /// the desktop's launcher and dock and for the login manager, each for the D-Bus time limit at most, and
    /// for the package tools; no service needs to be there.
    explicit MessageTransfer(QObject* parent = nullptr);

    /// Asks the desktop's screen saver and session manager now; a service that is absent or does not
    /// answer counts as "no". A screen saver over a locked screen gives ScreenSaverRunning.
    Screen_State getScreenState();

    /// Shows a notification; timeout in milliseconds, -1 the desktop's default, 0 never.
    void notifySend(const QString& msg, int timeout);

    /// Warns and starts the minute before the forced action of a policy code. A countdown that already
    /// runs starts again with the new code.
    void startTime(QString msg, int code);

    /// As startTime, but the warning offers the reboot at once.
    void rebootTime(QString msg, int code);

    /// Whether the session's user is a domain user; local accounts have uids up to 10000.
    bool isLdapUser();

    /// Whether an account policy message names this session's user.
    bool isExecPolicyByUID(QJsonObject& obj);

    /// Gives the desktop back its unrestricted state and stops the session policy service. Blocks until
    /// systemctl ends; failures are not looked at, so that each step is tried.
    void restoreConfiguration();

    /// Hands the daemon the full inventory, unless it is empty; before it a report of one change if type is
    /// "created" or "update". info is the software's display name and version, either may be missing.
    void uploadSoftware(QString type, QStringList info);

public Q_SLOTS:
    void onPolicyMsg(const QString& appID, const QString& payload);
    void onSoftwareChanged(QString action, QStringList info);
    void onTimeout();
    void getUserState();

private:
    void connectDaemon();
    void startSoftwareReports();
    void startTimers();
    void readLoginUser();
    void announceAgain();
    void uploadSoftwareChange(int change, const QStringList& info);
    bool isMeantForThisSession(SessionPolicy::Audience audience, QJsonObject& message);
    void leaveDomain(const QString& warning, int code);
    void startCountdown(int code);

    velkgInterface* m_velkgInterface = nullptr;
    prysInterface* m_prysInterface = nullptr;
    LauncherGuard* m_launcherGuard = nullptr;
    QTimer* m_actionTimer = nullptr;
    QTimer* m_stateTimer = nullptr;
    QString m_machineId; ///< read once; the inventory bears it
    QString m_userName;
    qint32 m_uid = 0;
    qint32 m_pendingAction = 0; ///< the policy code of the countdown's forced action
};
