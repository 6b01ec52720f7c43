#include "https_server.h"

#include <QJsonArray>
#include <QJsonDocument>

HttpsServer::HttpsServer()
{
    // The server lives by the host's clock, whatever clock the test has been given.
    auto environment = QProcessEnvironment::systemEnvironment();
    environment.remove(QStringLiteral("LD_PRELOAD"));
    m_process.setProcessEnvironment(environment);
    m_process.setProcessChannelMode(QProcess::ForwardedErrorChannel);
    m_process.start(QStringLiteral("/usr/bin/python3"),
                    {QStringLiteral("-B"), QStringLiteral(VELK_SOURCE_DIR "/tests/support/https_server.py"),
                     m_folder.path()});
    const QJsonObject ready = readLine();
    m_ports = ready[QStringLiteral("ports")].toObject();
    m_files = ready[QStringLiteral("files")].toObject();
}

HttpsServer::~HttpsServer()
{
    m_process.closeWriteChannel();
    m_process.waitForFinished();
}

QString HttpsServer::url(const char* door, const char* path) const
{
    const int port = m_ports[QString::fromUtf8(door)].toInt();
    return QStringLiteral("https://127.0.0.1:") + QString::number(port) + QString::fromUtf8(path);
}

QString HttpsServer::file(const char* name) const
{
    return m_files[QString::fromUtf8(name)].toString();
}

void HttpsServer::forgetRequests()
{
    m_process.waitForReadyRead(0);
    m_process.readAll();
}

QJsonObject HttpsServer::readLine()
{
    while (!m_process.canReadLine() && m_process.waitForReadyRead()) { }
    return QJsonDocument::fromJson(m_process.readLine()).object();
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
