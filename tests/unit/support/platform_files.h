#pragma once

#include <QFile>
#include <QUrl>

#include "files.h"
#include "https_server.h"
#include "information_files.h"

/// Puts the certificates where the agent looks for them, so that the server is its platform.
inline void installCertificates(const HttpsServer& server)
{
    const QString folder = QStringLiteral("/etc/velk/");
    if (!QFile::copy(server.file("ca"), folder + QStringLiteral("clientapi_ca.crt"))
        || !QFile::copy(server.file("client"), folder + QStringLiteral("ZEF_Velk.pem"))
        || !QFile::copy(server.file("client-key"), folder + QStringLiteral(".ZEF_Velk.key"))) {
        qFatal("cannot install the certificates");
    }
}

inline void writePlatformAddress(const QByteArray& host, const QByteArray& port)
{
    writeBytes(kUserInfo, R"({"server_host":")" + host + R"(","server_port":")" + port + R"("})");
}

/// The scripted HTTPS server as the agent's platform.
class PlatformServer : public HttpsServer
{
public:
    PlatformServer()
    {
        installCertificates(*this);
        writeAddress();
    }

    /// Makes it the platform of the information file.
    void writeAddress() const
    {
        writePlatformAddress("127.0.0.1", QByteArray::number(QUrl(url("demanding", "/")).port()));
    }

    /// Path and query of the next request.
    QString nextTarget()
    {
        return nextRequest()[QStringLiteral("line")].toString().section(QLatin1Char(' '), 1, 1);
    }
};
