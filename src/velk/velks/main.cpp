#include <QCoreApplication>
#include <QDBusConnection>
#include <QDebug>

#include "bus_watch.h"
#include "log_sink.h"
#include "memory.h"
#include "message_platform.h"
#include "message_transfer.h"
#include "session_user.h"
#include "types.h"

namespace {

QString getCurrentLoginUser()
{
    QString name = loginName();
    if (name.isEmpty()) {
        return name;
    }
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
    BusWatch systemBus(QDBusConnection::systemBus(), QStringLiteral("system"));
    BusWatch sessionBus(QDBusConnection::sessionBus(), QStringLiteral("session"));
    registerLauncherItemInfoMetaType();
    registerLauncherItemInfoListMetaType();

    QString userName = getCurrentLoginUser();
    qInfo() << "---getusername:" << userName;
    MessageTransfer messageTransfer;
    userName = platformUserName(userName);
    qInfo() << "---getusername:" << userName;
    MessagePlatform messagePlatform(nullptr, userName, &messageTransfer);

    return QCoreApplication::exec();
}
