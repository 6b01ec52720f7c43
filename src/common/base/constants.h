#pragma once

#include <QString>

/// Paths of the files that the daemon installs and maintains, and the platform's URL templates (%1 host, %2
/// port).
namespace velk {

inline const QString kUserinfoPath = QStringLiteral("/etc/velk/userinfo.json");
inline const QString kMachineidPath = QStringLiteral("/usr/share/velk/machine.txt");
inline const QString kBackupConfigPath = QStringLiteral("/etc/velk/config.ini");
inline const QString kScriptsPath = QStringLiteral("/usr/share/velk/scripts/");
inline const QString kVELKSoftwareListPath = QStringLiteral("/var/lib/velk/software_list.list");
inline const QString kPRYGSoftwareListPath = QStringLiteral("/var/lib/pryg/software_list.list");
inline const QString kServerCertPath = QStringLiteral("/etc/velk/clientapi_ca.crt");
inline const QString kPublicKeyPath = QStringLiteral("/etc/velk/ZEF_Velk.pem");
inline const QString kPrivateKeyPath = QStringLiteral("/etc/velk/.ZEF_Velk.key");

inline const QString kUrlHead = QStringLiteral("https://%1:%2/");
inline const QString KPasswdExpired = QStringLiteral("https://%1:%2/uim/v3/client/password/tips");
inline const QString kUploadInfoUrl = QStringLiteral("https://%1:%2/uim/v3/client/upload_info");
inline const QString kUploadInfoLogUrl = QStringLiteral("https://%1:%2/uim/v3/client/upinfo_log");

} // namespace velk
