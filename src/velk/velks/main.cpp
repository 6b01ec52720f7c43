#include <QCoreApplication>
#include <QDebug>

#include <pwd.h>
#include <unistd.h>

#include "message_platform.h"
#include "message_transfer.h"
#include "types.h"

namespace {

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
    QCoreApplication application(argc, argv);
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
