#pragma once

#include <QFile>
#include <QUrl>

#include "files.h"
#include "information_files.h"
#include "tls_peer.h"

/// Puts the certificates where the agent looks for them, so that the peer is its platform.
inline void installCertificates(const TlsPeer& peer)
{
    const QString folder = QStringLiteral("/etc/velk/");
    if (!QFile::copy(peer.file("ca"), folder + QStringLiteral("clientapi_ca.crt"))
        || !QFile::copy(peer.file("client"), folder + QStringLiteral("ZEF_Velk.pem"))
        || !QFile::copy(peer.file("client-key"), folder + QStringLiteral(".ZEF_Velk.key"))) {
        qFatal("cannot install the certificates");
    }
}

inline void writePlatformAddress(const QByteArray& host, const QByteArray& port)
{
    writeBytes(kUserInfo, R"({"server_host":")" + host + R"(","server_port":")" + port + R"("})");
}

/// Makes the peer the platform of the information file.
inline void writePlatformAddress(const TlsPeer& peer)
{
    writePlatformAddress("127.0.0.1", QByteArray::number(QUrl(peer.url("demanding", "/")).port()));
}
