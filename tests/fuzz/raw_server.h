#pragma once

#include <QByteArray>
#include <QString>

#include <openssl/ssl.h>

#include <memory>
#include <mutex>

/// A TLS server on 127.0.0.1 that reads one request per connection, sends the bytes that it was given, and
/// closes the connection. Serves from a thread of its own until the process ends.
class RawServer
{
public:
    /// Paths of PEM files.
    RawServer(const QString& certificate, const QString& key);

    [[nodiscard]] QString url() const;

    /// The bytes of the next replies. TLS is ended in order, or cut off.
    void setReply(const QByteArray& bytes, bool isCutOff);

private:
    void serve();
    void answer(SSL* connection);

    std::unique_ptr<SSL_CTX, decltype(&SSL_CTX_free)> m_context;
    int m_listener;
    std::mutex m_mutex;
    QByteArray m_reply;
    bool m_isCutOff = false;
};
