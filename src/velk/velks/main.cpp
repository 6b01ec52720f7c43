#include <QCoreApplication>
#include <QDBusConnection>
#include <QDebug>

#include <malloc.h>
#include <pwd.h>
#include <unistd.h>

#include "bus_watch.h"
#include "log_sink.h"
#include "message_platform.h"
#include "message_transfer.h"
#include "types.h"

namespace {

/// Gives the memory of large texts back to the system once they are gone. Without a fixed limit the C library
/// keeps ever larger blocks for later, and one burst of long policies would stay with the agent for its life.
void keepNoLargeBlocks()
{
    constexpr int kLargeBytes = 128 * 1024; // what the C library starts with
    mallopt(M_MMAP_THRESHOLD, kLargeBytes);
}

QString getCurrentLoginUser()
{
    const auto* entry = getpwuid(getuid());
    if (entry == nullptr) {
        return QString();
    }
    QString name = QString::fromLocal8Bit(entry->pw_name);
    qInfo() << "getCurrentLoginUser"
            << "getusername:" << name;
    return name;
}

} // namespace

int main(int argc, char* argv[])
{
    keepNoLargeBlocks();
    sendLogToJournal();
    QCoreApplication application(argc, argv);
    const BusWatch systemBus(QDBusConnection::systemBus(), QStringLiteral("system"));
    const BusWatch sessionBus(QDBusConnection::sessionBus(), QStringLiteral("session"));
    registerLauncherItemInfoMetaType();
    registerLauncherItemInfoListMetaType();

    QString userName = getCurrentLoginUser();
    qInfo() << "---getusername:" << userName;
    MessageTransfer messageTransfer;
    // Only one leading "@" goes: the platform knows domain users by the rest of the login name, while the
    // daemon is told the name without any "@".
    if (userName.startsWith(QLatin1Char('@'))) {
        userName.remove(0, 1);
    }
    qInfo() << "---getusername:" << userName;
    const MessagePlatform messagePlatform(nullptr, userName, &messageTransfer);

    return QCoreApplication::exec();
}
