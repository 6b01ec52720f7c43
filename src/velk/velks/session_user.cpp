#include "session_user.h"

#include <pwd.h>
#include <unistd.h>

bool isDomainUser()
{
    constexpr uid_t lastLocalUid = 10000;
    return getuid() > lastLocalUid;
}

QString loginName()
{
    const auto* entry = getpwuid(getuid());
    return entry == nullptr ? QString() : QString::fromLocal8Bit(entry->pw_name);
}

QString platformUserName(const QString& loginName)
{
    return loginName.startsWith(QLatin1Char('@')) ? loginName.mid(1) : loginName;
}

QString daemonUserName(QString loginName)
{
    return loginName.remove(QLatin1Char('@'));
}
