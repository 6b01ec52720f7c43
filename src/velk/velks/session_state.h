#pragma once

#include <QString>

/// What the login manager says of the session's user; a value that it does not tell is empty or 0.
struct LoginUser
{
    QString name; ///< as the daemon knows users: without any "@"
    qint32 uid = 0;
};

/// The session's state as SendUserStatus tells it; not the values of MessageTransfer::Screen_State.
enum UserStatus {
    UserActive = 1,
    UserLocked = 2,
    UserBehindScreenSaver = 3,
};

/// These ask the service at once, each for the D-Bus time limit at most.
LoginUser loginUser();
QString loginUserName();

/// A service that D-Bus can start is started. One that is absent or does not answer counts as "no".
bool isScreenSaverRunning();
bool isScreenLocked();
