#pragma once

#include <QObject>
#include <QString>

namespace velk::base {

/// The terminal's domain membership and its servers' addresses, as the daemon records them.
struct UserInfo
{
    bool isDomain = false;
    QString serverPort; // before the host: other code fills the record by position
    QString serverHost;
    QString domainHost;
    QString domainPort;
    QString terminalName;
};

/// Access to the daemon's information files: reads and writes the user information, a JSON object, and reads
/// the machine identifier. Each operation opens and closes its file. Failures are logged; a file that holds
/// no JSON object reads as an empty one.
///
/// The files are not locked: while the daemon rewrites one, it may read as empty. Every ok may be null.
class FileContent : public QObject
{
    Q_OBJECT

public:
    /// The only instance. The misspelt name is kept: other programs of the client use it.
    static FileContent* instace();

    /// The identifier, read once and cached; reload reads it again. If it cannot be read, ok is false and the
    /// result is the cached one.
    QString getMachineID(bool* ok = nullptr, bool reload = false);

    /// False if the value is missing. ok says whether it exists. ok is also true if the file cannot be
    /// opened: a terminal without the file is simply in no domain.
    static bool isDomain(bool* ok);

    /// Changes an existing value and never adds one; writes only if the value differs.
    static bool saveDomain(bool value);

    /// The platform's address. Fills in each part that it finds; true only if both are found.
    static bool getHostAndPort(QString& host, QString& port);

    /// The terminal's name on the platform; ok as in isDomain.
    static QString getTerminalAlias(bool* ok);

    /// All values. Those that an older daemon stored under other keys are also written back under today's.
    static UserInfo getUserInfo(bool* ok);

    /// Replaces the file, including keys that are not in the record.
    static bool saveUserInfo(const UserInfo& info);

private:
    FileContent() = default;

    QString m_machineId;
};

/// Adds or replaces one value of the user information. T is QString.
template <typename T> bool updateUserInfo(const QString& key, const T& value);

} // namespace velk::base
