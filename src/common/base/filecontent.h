#pragma once

#include <QObject>
#include <QString>

namespace velk::base {

/// The daemon's record of the terminal's domain membership and of the addresses of its servers.
struct UserInfo
{
    bool isDomain = false;
    QString serverPort; // the port before the host is intended: others fill the record by position
    QString serverHost;
    QString domainHost;
    QString domainPort;
    QString terminalName;
};

/// The daemon's information files: reads and writes the user information, a JSON object, and reads the
/// machine identifier. Each operation opens its file afresh and keeps nothing open. Failures are logged; a
/// file that is no JSON object reads as an empty one.
///
/// The files are not locked: what is read while the daemon rewrites one is an empty object.
/// Every ok may be null.
class FileContent : public QObject
{
    Q_OBJECT

public:
    /// The one instance; the misspelt name is intended, other programs of the client call it so.
    static FileContent* instace();

    /// The identifier, read once and then kept; reload reads it again. When it cannot be read, ok is false
    /// and the result is what was kept.
    QString getMachineID(bool* ok = nullptr, bool reload = false);

    /// False without the value. ok tells whether there is a value, and is also true if the file cannot be
    /// opened: a terminal without it is plainly in no domain.
    static bool isDomain(bool* ok);

    /// Changes a value that is in the file already and never adds one; writes only what differs.
    static bool saveDomain(bool value);

    /// The platform's address; fills what it finds, true only if it finds both.
    static bool getHostAndPort(QString& host, QString& port);

    /// The name that the terminal bears on the platform; ok as in isDomain.
    static QString getTerminalAlias(bool* ok);

    /// Everything at once. What an older daemon kept under other keys is also written back under today's.
    static UserInfo getUserInfo(bool* ok);

    /// Replaces the file, including what is no part of the record.
    static bool saveUserInfo(const UserInfo& info);

private:
    FileContent() = default;

    QString m_machineId;
};

/// Adds or replaces one value of the user information. T is QString.
template <typename T> bool updateUserInfo(const QString& key, const T& value);

} // namespace velk::base
