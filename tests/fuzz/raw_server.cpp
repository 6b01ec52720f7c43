#include "raw_server.h"

#include <QFile>

#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <thread>

#include "fuzzing.h"

namespace {

using Connection = std::unique_ptr<SSL, decltype(&SSL_free)>;

constexpr int kBacklog = 16;

/// The port that the system picks where it is still 0.
sockaddr_in addressOf(int socket)
{
    sockaddr_in address{};
    socklen_t size = sizeof(address);
    getsockname(socket, reinterpret_cast<sockaddr*>(&address), &size);
    return address;
}

int listenOnLoopback()
{
    const int listener = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    require(bind(listener, reinterpret_cast<const sockaddr*>(&address), sizeof(address)) == 0
                && listen(listener, kBacklog) == 0,
            "the server listens");
    return listener;
}

void readRequest(SSL* connection)
{
    QByteArray request;
    std::array<char, 4096> part{};
    while (!request.contains("\r\n\r\n")) {
        const int size = SSL_read(connection, part.data(), static_cast<int>(part.size()));
        if (size <= 0) {
            return;
        }
        request.append(part.data(), size);
    }
}

} // namespace

RawServer::RawServer(const QString& certificate, const QString& key)
    : m_context(SSL_CTX_new(TLS_server_method()), SSL_CTX_free)
    , m_listener(listenOnLoopback())
{
    const QByteArray certificatePath = QFile::encodeName(certificate);
    const QByteArray keyPath = QFile::encodeName(key);
    require(SSL_CTX_use_certificate_chain_file(m_context.get(), certificatePath.constData()) == 1
                && SSL_CTX_use_PrivateKey_file(m_context.get(), keyPath.constData(), SSL_FILETYPE_PEM) == 1,
            "the server has a certificate");
    std::thread([this] { serve(); }).detach();
}

QString RawServer::url() const
{
    return QStringLiteral("https://127.0.0.1:%1/").arg(ntohs(addressOf(m_listener).sin_port));
}

void RawServer::setReply(const QByteArray& bytes, bool isCutOff)
{
    const std::lock_guard lock(m_mutex);
    m_reply = bytes;
    m_isCutOff = isCutOff;
}

void RawServer::serve()
{
    // A client may leave in mid-reply; elsewhere in the program the signal is a finding.
    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, SIGPIPE);
    pthread_sigmask(SIG_BLOCK, &signals, nullptr);

    while (true) {
        const int client = accept4(m_listener, nullptr, nullptr, SOCK_CLOEXEC);
        constexpr int noDelay = 1;
        setsockopt(client, IPPROTO_TCP, TCP_NODELAY, &noDelay, sizeof(noDelay));
        const Connection connection(SSL_new(m_context.get()), SSL_free);
        SSL_set_fd(connection.get(), client);
        if (SSL_accept(connection.get()) == 1) {
            answer(connection.get());
        }
        close(client);
    }
}

void RawServer::answer(SSL* connection)
{
    readRequest(connection);
    const std::lock_guard lock(m_mutex);
    if (!m_reply.isEmpty()) {
        SSL_write(connection, m_reply.constData(), m_reply.size());
    }
    if (!m_isCutOff) {
        SSL_shutdown(connection);
    }
}
