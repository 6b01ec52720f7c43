#pragma once

#include <QByteArray>
#include <QList>
#include <QObject>
#include <QPair>
#include <QString>

#include <memory>

/// Blocking HTTPS client (HTTP/1.1, TLS 1.2 or newer) with a client certificate.
///
/// A request returns when the whole reply has arrived; no event loop runs meanwhile. Connections and TLS
/// sessions are kept for the life of the object and reused as long as the server keeps them. The kernel
/// notices within 50 s that the path of an idle connection is dead; a request on a path that has just died is
/// sent again on a new connection after 10 s. Redirects are not followed and no proxy is used. Child
/// processes inherit no descriptor of it.
///
/// A request without a response (refused, TLS failure, time limit, truncated or oversized reply) returns 0,
/// empties the reply and the raw headers, and logs one warning. Limits: 10 s to connect, 30 s in all; 8 MiB
/// of body, 256 KiB of headers, 100 KiB in a header line (libcurl's own limit). A body of undeclared
/// length ends with the connection: libcurl does not distinguish a cut from an end.
class HttpClientApi : public QObject
{
    Q_OBJECT

public:
    /// The bool is part of the interface and has no effect here.
    HttpClientApi(QObject* parent, bool);
    ~HttpClientApi() override;
    Q_DISABLE_COPY_MOVE(HttpClientApi)

    /// Paths of PEM files, read again for each connection. The server's certificate and host name are
    /// verified against `caCert` and nothing else: without it, every request fails. With an empty
    /// `clientCert`, no client certificate is offered; with an empty `clientKey`, the key is read from the
    /// certificate's file. An encrypted key counts as unreadable.
    void setSSLConfig(const QString& caCert, const QString& clientCert, const QString& clientKey);

    /// Requests `url`, with `body` as content unless it is empty, and returns the status (0: no response).
    /// `reply` receives the response's body, read as UTF-8. With `isJson`, the content type is JSON;
    /// otherwise none is sent. Characters of `url` that a request line cannot carry (control characters,
    /// blanks, "#", those outside ASCII) are percent-encoded as UTF-8; all else is sent unchanged.
    int getRequest(QString& reply, const QString& url, const QString& body, bool isJson);
    int putRequest(QString& reply, const QString& url, const QString& body, bool isJson);

    /// Headers of the last response, names and values as the server sent them, in their order. Interim
    /// responses and trailers are excluded.
    [[nodiscard]] QList<QPair<QByteArray, QByteArray>> getRawHeader() const;

private:
    struct CloseShare
    {
        void operator()(void* share) const;
    };

    struct CloseMulti
    {
        void operator()(void* multi) const;
    };

    int request(const char* method, QString& reply, const QString& url, const QString& body, bool isJson);

    std::unique_ptr<void, CloseShare> m_share; // TLS sessions
    std::unique_ptr<void, CloseMulti> m_multi; // connections, looked-up names
    QByteArray m_caCert;
    QByteArray m_clientCert;
    QByteArray m_clientKey;
    QList<QPair<QByteArray, QByteArray>> m_rawHeaders;
};
