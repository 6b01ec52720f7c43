#include <QAbstractEventDispatcher>
#include <QCoreApplication>
#include <QDBusConnection>
#include <QDebug>

#include <malloc.h>
#include <pwd.h>
#include <unistd.h>

#include <ctime>

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

/// Does the same for what a burst of small things took: Qt queues signals as fast as they come, and what it
/// took for 200,000 of them would stay with the agent.
void giveMemoryBackAfterWork()
{
    constexpr std::clock_t kMuchWork = CLOCKS_PER_SEC / 5;
    QObject::connect(QAbstractEventDispatcher::instance(), &QAbstractEventDispatcher::aboutToBlock,
                     [last = std::clock()]() mutable {
                         const std::clock_t now = std::clock();
                         if (now - last > kMuchWork) {
                             malloc_trim(0);
                             last = now;
                         }
                     });
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
    giveMemoryBackAfterWork();
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
