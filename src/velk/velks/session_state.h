#pragma once

#include <QString>

/// The session's user according to the login manager; missing values are empty or 0.
struct LoginUser
{
    QString name; ///< in the daemon's form, without any "@"
    qint32 uid = 0;
};

/// The session's state in SendUserStatus; the values differ from MessageTransfer::Screen_State.
enum UserStatus {
    UserActive = 1,
    UserLocked = 2,
    UserBehindScreenSaver = 3,
};

/// These ask the service on each call and wait for the D-Bus time limit at most.
LoginUser loginUser();
QString loginUserName();

/// D-Bus starts the service if it can. One that is absent or does not answer counts as "no".
bool isScreenSaverRunning();
bool isScreenLocked();
