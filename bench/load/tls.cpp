#include "tls.h"

#include <array>
#include <cstdlib>
#include <iostream>

namespace {

void require(bool condition, const char* what)
{
    if (!condition) {
        std::cerr << "platform: cannot use " << what << '\n';
        std::exit(EXIT_FAILURE);
    }
}

size_t contentLength(const std::string& head)
{
    const std::string name = "\r\nContent-Length: ";
    const auto found = head.find(name);
    return found == std::string::npos ? 0 : std::stoul(head.substr(found + name.size()));
}

} // namespace

TlsContext::TlsContext(const char* certificate, const char* key, const char* authority)
    : m_context(SSL_CTX_new(TLS_server_method()), SSL_CTX_free)
{
    require(SSL_CTX_use_certificate_chain_file(get(), certificate) == 1, certificate);
    require(SSL_CTX_use_PrivateKey_file(get(), key, SSL_FILETYPE_PEM) == 1, key);
    require(SSL_CTX_load_verify_locations(get(), authority, nullptr) == 1, authority);
    SSL_CTX_set_verify(get(), SSL_VERIFY_PEER | SSL_VERIFY_FAIL_IF_NO_PEER_CERT, nullptr);
    // Without it a client that resumes its session is refused.
    constexpr unsigned char id = 1;
    SSL_CTX_set_session_id_context(get(), &id, sizeof id);
}

TlsStream::TlsStream(const TlsContext& context, int socket)
    : m_ssl(SSL_new(context.get()), SSL_free)
{
    SSL_set_fd(m_ssl.get(), socket);
    m_isOpen = SSL_accept(m_ssl.get()) == 1;
}

bool TlsStream::readRequest(std::string& line, std::string& body)
{
    size_t headEnd = std::string::npos;
    while ((headEnd = m_received.find("\r\n\r\n")) == std::string::npos) {
        if (!fill()) {
            return false;
        }
    }
    const size_t bodyBegin = headEnd + 4;
    const size_t length = contentLength(m_received.substr(0, headEnd));
    while (m_received.size() < bodyBegin + length) {
        if (!fill()) {
            return false;
        }
    }
    line = m_received.substr(0, m_received.find("\r\n"));
    body = m_received.substr(bodyBegin, length);
    m_received.erase(0, bodyBegin + length);
    return true;
}

void TlsStream::write(const std::string& text)
{
    SSL_write(m_ssl.get(), text.data(), static_cast<int>(text.size()));
}

uint64_t TlsStream::bytes() const
{
    return BIO_number_read(SSL_get_rbio(m_ssl.get())) + BIO_number_written(SSL_get_wbio(m_ssl.get()));
}

bool TlsStream::fill()
{
    std::array<char, 16384> part{};
    const int size = SSL_read(m_ssl.get(), part.data(), static_cast<int>(part.size()));
    if (size <= 0) {
        return false;
    }
    m_received.append(part.data(), static_cast<size_t>(size));
    return true;
}
