#include "filecontent.h"

#include <QDebug>
#include <QJsonDocument>
#include <QJsonObject>

#include <optional>

#include "baseutils.h"
#include "constants.h"
#include "fileproxy.h"

namespace velk::base {

namespace {

const QString kIsDomain = QStringLiteral("is_Domain");
const QString kServerPort = QStringLiteral("server_port");
const QString kServerHost = QStringLiteral("server_host");
const QString kDomainHost = QStringLiteral("domain_host");
const QString kDomainPort = QStringLiteral("domain_port");
const QString kTerminalName = QStringLiteral("terminal_name");
const QString kServerIp = QStringLiteral("server_ip"); // where older daemons keep the domain's host

const QString kGetUserInfo = QStringLiteral("getUserInfo");

void report(bool* ok, bool value)
{
    if (ok != nullptr) {
        *ok = value;
    }
}

bool openFile(FileProxy& file, const QString& path, QIODevice::OpenMode mode, const QString& operation)
{
    const bool opened = file.open(path, mode);
    if (!opened) {
        BaseUtils::openFailedLog(operation);
    }
    return opened;
}

/// Nothing if the file cannot be opened; an empty object if the file holds none.
std::optional<QJsonObject> readUserInfo(FileProxy& file, const QString& operation)
{
    if (!openFile(file, kUserinfoPath, QIODevice::ReadOnly, operation)) {
        return std::nullopt;
    }
    return QJsonDocument::fromJson(file.readAll()).object();
}

bool writeUserInfo(FileProxy& file, const QJsonObject& info)
{
    return file.write(QJsonDocument(info).toJson(QJsonDocument::Indented)) >= 1;
}

template <typename T> T readValue(const QString& key, const QString& operation, bool* ok)
{
    T value{};
    FileProxy file;
    const auto info = readUserInfo(file, operation);
    // Without a file ok is true: callers treat such a terminal as one outside every domain and without an
    // alias, not as a broken one.
    report(ok, !info || BaseUtils::getJsonObjectValue(*info, key, value, operation));
    return value;
}

/// If the key is missing, takes the older key's value and writes it back under the key. False if neither
/// exists or if writing back fails.
bool readOrMigrate(const QJsonObject& info, const QString& key, const QString& olderKey, QString& value)
{
    return BaseUtils::getJsonObjectValue(info, key, value, kGetUserInfo)
        || (BaseUtils::getJsonObjectValue(info, olderKey, value, kGetUserInfo) && updateUserInfo(key, value));
}

} // namespace

FileContent* FileContent::instace()
{
    static FileContent instance;
    return &instance;
}

QString FileContent::getMachineID(bool* ok, bool reload)
{
    if (!m_machineId.isEmpty() && !reload) {
        report(ok, true);
        return m_machineId;
    }
    FileProxy file;
    const bool opened = openFile(file, kMachineidPath, QIODevice::ReadOnly, QStringLiteral("getMachineID"));
    report(ok, opened);
    if (opened) {
        const QByteArray text = file.readAll().trimmed();
        m_machineId = text.isEmpty() ? QString() : QString::fromUtf8(text); // up to the first NUL byte
    }
    return m_machineId;
}

bool FileContent::isDomain(bool* ok)
{
    return readValue<bool>(kIsDomain, QStringLiteral("isDomain"), ok);
}

bool FileContent::saveDomain(bool value)
{
    const QString operation = QStringLiteral("saveDomain");
    FileProxy file;
    auto info = readUserInfo(file, operation);
    if (!info) {
        return false;
    }
    if (!info->contains(kIsDomain)) {
        qInfo() << "It is not contain in info file, key:" << kIsDomain;
        return false;
    }
    if (info->value(kIsDomain).toBool(false) == value) {
        qDebug() << "value is the same in file, key:" << kIsDomain;
        return true;
    }
    if (!openFile(file, kUserinfoPath, QIODevice::WriteOnly, operation)) {
        return false;
    }
    info->insert(kIsDomain, value);
    const bool written = writeUserInfo(file, *info);
    if (!written) {
        qInfo() << "write value failed, key:" << kIsDomain;
    }
    return written;
}

bool FileContent::getHostAndPort(QString& host, QString& port)
{
    const QString operation = QStringLiteral("getHostAndPort");
    FileProxy file;
    const auto info = readUserInfo(file, operation);
    if (!info) {
        return false;
    }
    const bool hasHost = BaseUtils::getJsonObjectValue(*info, kServerHost, host, operation);
    const bool hasPort = BaseUtils::getJsonObjectValue(*info, kServerPort, port, operation);
    return hasHost && hasPort;
}

QString FileContent::getTerminalAlias(bool* ok)
{
    return readValue<QString>(kTerminalName, QStringLiteral("getTerminalAlias"), ok);
}

UserInfo FileContent::getUserInfo(bool* ok)
{
    UserInfo result;
    FileProxy file;
    const auto info = readUserInfo(file, kGetUserInfo);
    if (!info) {
        report(ok, true); // as in readValue
        return result;
    }
    BaseUtils::getJsonObjectValue(*info, kIsDomain, result.isDomain, kGetUserInfo);
    BaseUtils::getJsonObjectValue(*info, kServerHost, result.serverHost, kGetUserInfo);
    readOrMigrate(*info, kDomainHost, kServerIp, result.domainHost);
    // ok depends on these three only: callers can work with what an older daemon recorded.
    const bool hasDomainPort = readOrMigrate(*info, kDomainPort, kServerPort, result.domainPort);
    const bool hasServerPort =
        BaseUtils::getJsonObjectValue(*info, kServerPort, result.serverPort, kGetUserInfo);
    const bool hasName =
        BaseUtils::getJsonObjectValue(*info, kTerminalName, result.terminalName, kGetUserInfo);
    report(ok, hasDomainPort && hasServerPort && hasName);
    return result;
}

bool FileContent::saveUserInfo(const UserInfo& info)
{
    FileProxy file;
    if (!openFile(file, kUserinfoPath, QIODevice::WriteOnly, QStringLiteral("saveUserInfo"))) {
        return false;
    }
    const bool written = writeUserInfo(file,
                                       {{kIsDomain, info.isDomain},
                                        {kServerHost, info.serverHost},
                                        {kServerPort, info.serverPort},
                                        {kDomainHost, info.domainHost},
                                        {kDomainPort, info.domainPort},
                                        {kTerminalName, info.terminalName}});
    if (!written) {
        qInfo() << "write info json failed";
    }
    return written;
}

template <typename T> bool updateUserInfo(const QString& key, const T& value)
{
    const QString operation = QStringLiteral("updateUserInfo");
    FileProxy file;
    // Read first: opening for writing empties the file.
    auto info = readUserInfo(file, operation);
    if (!info || !openFile(file, kUserinfoPath, QIODevice::WriteOnly | QIODevice::Truncate, operation)) {
        return false;
    }
    info->insert(key, value);
    const bool written = writeUserInfo(file, *info);
    if (!written) {
        qInfo() << "write value failed, key:" << key;
    }
    return written;
}

template bool updateUserInfo<QString>(const QString& key, const QString& value);

} // namespace velk::base
