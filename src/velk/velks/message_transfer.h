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
/// forwards the others to the session policy service, and reports the user, the session's state, the
/// applications and the software to the daemon.
class MessageTransfer : public QObject
{
    Q_OBJECT

public:
    enum Screen_State {
        ScreenSaverRunning,
        ScreenLocked,
        ScreenActive,
    };

    /// Uploads the software inventory and reports the user and an active session to the daemon. Waits for the
    /// desktop's launcher and dock and for the login manager, each for the D-Bus time limit at most, and for
    /// the package tools. Every service may be absent.
    explicit MessageTransfer(QObject* parent = nullptr);

    /// Asks the desktop's screen saver and session manager now; a service that is absent or does not answer
    /// counts as "no". A running screen saver takes precedence over a lock.
    Screen_State getScreenState();

    /// Shows a notification; timeout in milliseconds, -1 the desktop's default, 0 never.
    void notifySend(const QString& msg, int timeout);

    /// Shows the warning and starts the one-minute countdown to the forced action of a policy code. A running
    /// countdown restarts with the new code.
    void startTime(QString msg, int code);

    /// Like startTime, but the warning also offers to reboot now.
    void rebootTime(QString msg, int code);

    /// Whether the session's user is a domain user; local accounts have uids up to 10000.
    bool isLdapUser();

    /// Whether an account policy is addressed to this session's user.
    bool isExecPolicyByUID(QJsonObject& obj);

    /// Lifts all restrictions of the desktop and stops the session policy service. Blocks until systemctl
    /// ends; performs every step even if another fails.
    void restoreConfiguration();

    /// Uploads the full inventory unless it is empty. If type is "created" or "update", first uploads a
    /// report of that change. info holds the software's display name and version; either may be missing.
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
    void reportAgain();
    void uploadSoftwareChange(int change, const QStringList& info);
    bool isMeantForThisSession(SessionPolicy::Audience audience, QJsonObject& message);
    void leaveDomain(const QString& warning, int code);
    void startCountdown(int code);

    velkgInterface* m_velkgInterface = nullptr;
    prysInterface* m_prysInterface = nullptr;
    LauncherGuard* m_launcherGuard = nullptr;
    QTimer* m_actionTimer = nullptr;
    QTimer* m_stateTimer = nullptr;
    QString m_machineId; ///< read once, for the inventory
    QString m_userName;
    qint32 m_uid = 0;
    qint32 m_pendingAction = 0; ///< the policy code of the countdown's forced action
};
