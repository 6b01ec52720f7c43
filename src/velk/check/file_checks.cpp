#include "file_checks.h"

#include <QFile>
#include <QJsonDocument>

#include <algorithm>

#include "constants.h"
#include "filecontent.h"

namespace velk::check {

namespace {

using velk::base::FileContent;

const QString kInformationFile = QStringLiteral("information file");

/// Whether the agent can use the file at all.
Finding checkReadable(const SessionUser& user)
{
    QFile file(kUserinfoPath);
    if (!file.open(QIODevice::ReadOnly)) {
        return {user.isDomainUser ? Grade::Bad : Grade::Warning, kInformationFile,
                QStringLiteral("%1 cannot be read (%2): the terminal's daemon writes it; without it the "
                               "agent knows neither the platform nor the terminal's name")
                    .arg(kUserinfoPath, file.errorString())};
    }
    QJsonParseError error{};
    const auto document = QJsonDocument::fromJson(file.readAll(), &error);
    if (!document.isObject()) {
        const QString reason = error.error == QJsonParseError::NoError
            ? QStringLiteral("another kind of JSON")
            : error.errorString();
        return {user.isDomainUser ? Grade::Bad : Grade::Warning, kInformationFile,
                QStringLiteral("%1 holds no JSON object (%2): the agent reads it as an empty one")
                    .arg(kUserinfoPath, reason)};
    }
    return {Grade::Good, kInformationFile, kUserinfoPath + QStringLiteral(" can be read")};
}

Finding checkDomain(const SessionUser& user)
{
    const QString subject = QStringLiteral("domain");
    bool known = false;
    const bool isDomain = FileContent::isDomain(&known);
    if (!known) {
        return {Grade::Warning, subject,
                QStringLiteral("the information file does not say whether the terminal is in a domain")};
    }
    if (isDomain) {
        return {Grade::Good, subject, QStringLiteral("the terminal is in a domain")};
    }
    return {user.isDomainUser ? Grade::Warning : Grade::Good, subject,
            QStringLiteral("the terminal is in no domain")};
}

Finding checkAddress()
{
    const QString subject = QStringLiteral("platform address");
    QString host;
    QString port;
    if (!FileContent::getHostAndPort(host, port) || host.isEmpty()) {
        return {Grade::Bad, subject,
                QStringLiteral("the information file names no server_host and server_port: the agent never "
                               "asks for messages")};
    }
    if (port.toUShort() == 0) {
        return {Grade::Bad, subject, QStringLiteral("server_port \"%1\" is no port number").arg(port)};
    }
    return {Grade::Good, subject, QStringLiteral("%1, port %2").arg(host, port)};
}

Finding checkTerminalName()
{
    const QString subject = QStringLiteral("terminal name");
    const QString name = FileContent::getTerminalAlias(nullptr);
    if (name.isEmpty()) {
        return {Grade::Warning, subject,
                QStringLiteral("the information file names none: software reports lack it")};
    }
    return {Grade::Good, subject, name};
}

bool isSoundIdentifier(const QString& identifier)
{
    return std::all_of(identifier.cbegin(), identifier.cend(),
                       [](QChar character) { return character.isPrint() && !character.isSpace(); });
}

Finding checkRestoreFile(const QString& path, const QString& consequence)
{
    const QString subject = QStringLiteral("restore");
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly)) {
        return {Grade::Warning, subject,
                QStringLiteral("%1 cannot be read (%2): %3").arg(path, file.errorString(), consequence)};
    }
    return {Grade::Good, subject, path + QStringLiteral(" can be read")};
}

} // namespace

Findings checkInformationFile(const SessionUser& user)
{
    Findings findings{checkReadable(user)};
    if (findings.constFirst().grade != Grade::Good) {
        return findings; // an unreadable file lacks everything
    }
    findings.append(checkDomain(user));
    if (user.isDomainUser) {
        findings.append(checkAddress());
    }
    findings.append(checkTerminalName());
    return findings;
}

Finding checkMachineIdentifier()
{
    const QString subject = QStringLiteral("machine identifier");
    bool read = false;
    const QString identifier = FileContent::instace()->getMachineID(&read);
    if (!read) {
        return {Grade::Bad, subject,
                QStringLiteral("%1 cannot be read: software reports do not identify this terminal")
                    .arg(kMachineidPath)};
    }
    if (identifier.isEmpty()) {
        return {Grade::Bad, subject,
                QStringLiteral("%1 is empty: software reports do not identify this terminal")
                    .arg(kMachineidPath)};
    }
    if (!isSoundIdentifier(identifier)) {
        return {Grade::Warning, subject,
                QStringLiteral("%1 holds blanks, line ends or control characters inside the identifier")
                    .arg(kMachineidPath)};
    }
    return {Grade::Good, subject, identifier};
}

Findings checkRestoreFiles()
{
    return {checkRestoreFile(kScriptsPath + QStringLiteral("restore_config.bash"),
                             QStringLiteral("leaving the domain restores nothing but the desktop")),
            checkRestoreFile(kBackupConfigPath,
                             QStringLiteral("leaving the domain gives the desktop an empty control center"))};
}

} // namespace velk::check
