#include "tls_peer.h"

#include <QJsonArray>
#include <QJsonDocument>

TlsPeer::TlsPeer()
{
    // The server lives by the host's clock, whatever clock the test has been given.
    auto environment = QProcessEnvironment::systemEnvironment();
    environment.remove(QStringLiteral("LD_PRELOAD"));
    m_server.setProcessEnvironment(environment);
    m_server.setProcessChannelMode(QProcess::ForwardedErrorChannel);
    m_server.start(QStringLiteral("/usr/bin/python3"),
                   {QStringLiteral("-B"), QStringLiteral(VELK_SOURCE_DIR "/tests/support/tls_peer.py"),
                    m_folder.path()});
    const QJsonObject ready = readLine();
    m_ports = ready[QStringLiteral("ports")].toObject();
    m_files = ready[QStringLiteral("files")].toObject();
}

TlsPeer::~TlsPeer()
{
    m_server.closeWriteChannel();
    m_server.waitForFinished();
}

QString TlsPeer::url(const char* door, const char* path) const
{
    const int port = m_ports[QString::fromUtf8(door)].toInt();
    return QStringLiteral("https://127.0.0.1:") + QString::number(port) + QString::fromUtf8(path);
}

QString TlsPeer::file(const char* name) const
{
    return m_files[QString::fromUtf8(name)].toString();
}

void TlsPeer::forgetRequests()
{
    m_server.waitForReadyRead(0);
    m_server.readAll();
}

QJsonObject TlsPeer::readLine()
{
    while (!m_server.canReadLine() && m_server.waitForReadyRead()) { }
    return QJsonDocument::fromJson(m_server.readLine()).object();
}

QString headerOf(const QJsonObject& request, const char* name)
{
    const QJsonArray headers = request[QStringLiteral("headers")].toArray();
    for (const QJsonValue& header : headers) {
        if (header[0].toString() == QString::fromUtf8(name)) {
            return header[1].toString();
        }
    }
    return {};
}
