#pragma once

#include <QString>

#include "prys_introspection.h"
#include "velkg_introspection.h"

/// Bus names of the services that the agent uses.
namespace velk::service {

inline const QString kDaemon = QStringLiteral(VELKG_INTERFACE_NAME);
inline const QString kLoginManager = QStringLiteral("org.freedesktop.login1");
inline const QString kIdentityService = QStringLiteral("com.norix.velk.iam");

inline const QString kPolicyService = QStringLiteral(PRYS_INTERFACE_NAME);
inline const QString kNotifications = QStringLiteral("com.norix.kpx.Notification");
inline const QString kScreenSaver = QStringLiteral("com.norix.ScreenSaver");
inline const QString kSessionManager = QStringLiteral("com.norix.SessionManager");
inline const QString kDock = QStringLiteral("com.norix.kpx.daemon.Dock");
inline const QString kLauncher = QStringLiteral("com.norix.kpx.daemon.Launcher");

} // namespace velk::service
