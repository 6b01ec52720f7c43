#pragma once

#include <QString>

#include "finding.h"

namespace velk::check {

/// The session's user. Only domain users get messages of the platform.
struct SessionUser
{
    QString loginName; ///< empty without an account entry
    uint uid;
    bool isDomainUser;

    static SessionUser current();
};

Finding checkUser(const SessionUser& user);

} // namespace velk::check
