#pragma once

#include <QDBusAbstractInterface>
#include <QDBusPendingReply>

#include "types.h"

/// Proxy of the desktop's launcher. Register its item types before connecting the signal or calling the
/// method. The desktop's library gives its proxies names with underscores.
// NOLINTNEXTLINE(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)
class __Launcherd : public QDBusAbstractInterface
{
    Q_OBJECT

public:
    static const char* staticInterfaceName() { return "com.norix.kpx.daemon.Launcher"; }

    __Launcherd(const QString& service, const QString& path, const QDBusConnection& connection,
                QObject* parent = nullptr);

    /// Requests all items and does not wait.
    QDBusPendingReply<LauncherItemInfoList> GetAllItemInfos();

Q_SIGNALS:
    void ItemChanged(const QString& action, LauncherItemInfo info, qlonglong categoryId);
};
