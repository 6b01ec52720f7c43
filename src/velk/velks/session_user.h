#pragma once

#include <QString>

/// Whether this process runs as a domain user; local accounts have uids up to 10000.
bool isDomainUser();

/// The user's login name in the account database; empty for a uid without an entry.
QString loginName();

/// A domain user's name on the platform: the login name without one leading "@".
QString platformUserName(const QString& loginName);

/// A user's name for the daemon: the login name without any "@", wherever it is.
QString daemonUserName(QString loginName);
