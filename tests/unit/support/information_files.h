#pragma once

#include <QString>

/// Where the daemon keeps what FileContent reads, and what the attempts at it log.
inline const QString kUserInfo = QStringLiteral("/etc/velk/userinfo.json");
inline const QString kMachineId = QStringLiteral("/usr/share/velk/machine.txt");

inline const QString kReadMode = QStringLiteral("ReadOnly");
inline const QString kWriteMode = QStringLiteral("WriteOnly");

inline QString openFailure(const QString& path, const QString& mode, bool exists)
{
    return QStringLiteral("warning: open file failed, file: \"%1\" , mode: OpenMode( \"%2\" ) , exist: %3")
        .arg(path, mode, exists ? QStringLiteral("true") : QStringLiteral("false"));
}

inline QString operationFailure(const char* operation)
{
    return QStringLiteral("warning: \"%1\" open file failed!").arg(QString::fromLatin1(operation));
}

inline QString missingKey(const char* operation, const char* key)
{
    return QStringLiteral("warning: \"%1\" can not get json key: \"%2\"")
        .arg(QString::fromLatin1(operation), QString::fromLatin1(key));
}
