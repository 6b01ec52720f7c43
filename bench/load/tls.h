#pragma once

#include <openssl/ssl.h>

#include <cstdint>
#include <memory>
#include <string>

/// A server's side of TLS; who connects needs a certificate of the given authority. Files are PEM.
/// The server of sandbox/platform/https.py does the same, but a rate measured against it would be its own.
class TlsContext
{
public:
    /// Ends the program where a file cannot be used.
    TlsContext(const char* certificate, const char* key, const char* authority);

    [[nodiscard]] SSL_CTX* get() const { return m_context.get(); }

private:
    std::unique_ptr<SSL_CTX, decltype(&SSL_CTX_free)> m_context;
};

/// One connection, after its handshake.
class TlsStream
{
public:
    TlsStream(const TlsContext& context, int socket);

    [[nodiscard]] bool isOpen() const { return m_isOpen; }
    /// Whether the handshake resumed the TLS session of an earlier connection.
    [[nodiscard]] bool isResumed() const { return SSL_session_reused(m_ssl.get()) == 1; }

    /// One HTTP request: its first line and its body; false at the end of the connection.
    bool readRequest(std::string& line, std::string& body);

    void write(const std::string& text);

    /// What has gone over the connection so far, in both directions and with all that TLS adds.
    [[nodiscard]] uint64_t bytes() const;

private:
    bool fill();

    std::unique_ptr<SSL, decltype(&SSL_free)> m_ssl;
    std::string m_received;
    bool m_isOpen = false;
};
