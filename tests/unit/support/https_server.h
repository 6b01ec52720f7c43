#pragma once

#include <QJsonObject>
#include <QProcess>
#include <QString>
#include <QTemporaryDir>

/// The scripted HTTPS server of tests/support/https_server.py, which describes its doors, files and paths.
class HttpsServer
{
public:
    /// Serves when the constructor returns.
    HttpsServer();
    ~HttpsServer();
    Q_DISABLE_COPY_MOVE(HttpsServer)

    /// `path` may have a query and characters outside ASCII, in UTF-8.
    QString url(const char* door, const char* path) const;
    QString file(const char* name) const;

    /// The next of the requests that the server has received, in the order of their arrival; empty when none
    /// comes.
    QJsonObject nextRequest() { return readLine(); }
    /// Drops the requests received so far.
    void forgetRequests();

private:
    QJsonObject readLine();

    QTemporaryDir m_folder;
    QProcess m_process;
    QJsonObject m_ports;
    QJsonObject m_files;
};

/// Value of the first header of that name in a request of the server, null when there is none.
QString headerOf(const QJsonObject& request, const char* name);
