#include "user_check.h"

#include <unistd.h>

#include "session_user.h"

namespace velk::check {

SessionUser SessionUser::current()
{
    return {::loginName(), getuid(), ::isDomainUser()};
}

Finding checkUser(const SessionUser& user)
{
    const QString subject = QStringLiteral("user");
    if (user.loginName.isEmpty()) {
        return {Grade::Bad, subject,
                QStringLiteral("uid %1 has no account entry: the agent does not know the user's name")
                    .arg(user.uid)};
    }
    const QString who = QStringLiteral("%1, uid %2").arg(user.loginName).arg(user.uid);
    if (user.isDomainUser) {
        return {Grade::Good, subject, QStringLiteral("domain user ") + who};
    }
    return {Grade::Good, subject,
            QStringLiteral("local user %1: policies for accounts of the domain, messages of the platform and "
                           "the password check do not concern this session")
                .arg(who)};
}

} // namespace velk::check
