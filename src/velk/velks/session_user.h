#pragma once

#include <QString>

/// Whether the program runs for a domain user; local accounts have uids up to 10000.
bool isDomainUser();

/// The user's login name as the account database has it; empty for a uid without an entry.
QString loginName();

/// The name that the platform knows a domain user by: the login name without one leading "@".
QString platformUserName(const QString& loginName);

/// The name that the daemon knows a user by: the login name without any "@", wherever it stands.
QString daemonUserName(QString loginName);
