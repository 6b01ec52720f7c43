/// The management platform as one fast program: it lists one unread message at a time until all are read.
///
/// usage: bench_platform PORT CERTIFICATE KEY AUTHORITY
///
/// Commands, one per line on the standard input:
///   messages COUNT  from now on COUNT messages are unread; the reply to the password tips reports them too,
///   as no
///                   other platform's does, so that an agent begins to read at its start
///   close           close all connections
///   counts          print: counts HANDSHAKES LISTS READS BYTES (both ways, with TLS) RESUMED (handshakes
///   that
///                   resumed a TLS session)
/// On the standard output, with the monotonic clock in nanoseconds:
///   ready | tips TIME (answered) | listed TIME (no message was unread) | drained BEGIN END (the first list
///   request and the reply to the last mark)

#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <cstdint>
#include <iostream>
#include <mutex>
#include <set>
#include <sstream>
#include <string>
#include <thread>

#include "tls.h"

namespace {

long long now()
{
    return std::chrono::duration_cast<std::chrono::nanoseconds>(
               std::chrono::steady_clock::now().time_since_epoch())
        .count();
}

std::string reply(const std::string& headers, const std::string& body)
{
    return "HTTP/1.1 200 OK\r\nContent-Type: application/json\r\n" + headers
        + "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body;
}

/// The platform's messages; thread-safe.
class MessageStore
{
public:
    void post(int messages)
    {
        const std::lock_guard lock(m_mutex);
        m_unread = messages;
        m_begin = 0;
    }

    std::string list()
    {
        const std::lock_guard lock(m_mutex);
        ++m_lists;
        if (m_begin == 0) {
            m_begin = now();
        }
        if (m_unread == 0) {
            std::cout << "listed " << now() << '\n' << std::flush;
            return reply(count(), "[]");
        }
        const std::string number = std::to_string(m_unread);
        return reply(count(),
                     R"([{"uuid":"message-)" + number + R"(","uid":"u","send_uid":"admin","title":"message )"
                         + number
                         + R"(","content":"text","created_at":"2026-01-01 00:00:00","read_at":""}])");
    }

    /// Returns the reply, and whether no message is unread any more.
    std::pair<std::string, bool> markRead()
    {
        const std::lock_guard lock(m_mutex);
        ++m_reads;
        --m_unread;
        return {reply("", R"({"code":0})"), m_unread == 0};
    }

    std::string tips()
    {
        const std::lock_guard lock(m_mutex);
        return reply(m_unread > 0 ? count() : "", R"({"code":0,"data":{"result":false,"msg":""}})");
    }

    void printDrained()
    {
        const std::lock_guard lock(m_mutex);
        std::cout << "drained " << m_begin << ' ' << now() << '\n' << std::flush;
    }

    void printCounts(int handshakes, uint64_t bytes, int resumed)
    {
        const std::lock_guard lock(m_mutex);
        std::cout << "counts " << handshakes << ' ' << m_lists << ' ' << m_reads << ' ' << bytes << ' '
                  << resumed << '\n'
                  << std::flush;
    }

private:
    [[nodiscard]] std::string count() const { return "X-Total-Count: " + std::to_string(m_unread) + "\r\n"; }

    std::mutex m_mutex;
    int m_unread = 0;
    int m_lists = 0;
    int m_reads = 0;
    long long m_begin = 0;
};

class FastPlatform
{
public:
    FastPlatform(const TlsContext& context, uint16_t port)
        : m_context(context)
        , m_listener(socket(AF_INET, SOCK_STREAM, 0))
    {
        const int yes = 1;
        setsockopt(m_listener, SOL_SOCKET, SO_REUSEADDR, &yes, sizeof yes);
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_port = htons(port);
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        // The socket interface wants it so. NOLINTNEXTLINE(cppcoreguidelines-pro-type-reinterpret-cast)
        if (bind(m_listener, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0
            || listen(m_listener, SOMAXCONN) != 0) {
            std::perror("platform");
            std::exit(EXIT_FAILURE);
        }
    }

    void serve()
    {
        while (true) {
            const int connection = accept(m_listener, nullptr, nullptr);
            if (connection >= 0) {
                std::thread([this, connection] { serve(connection); }).detach();
            }
        }
    }

    void obey(const std::string& command)
    {
        std::istringstream words(command);
        std::string verb;
        int number = 0;
        words >> verb >> number;
        if (verb == "messages") {
            m_store.post(number);
        } else if (verb == "close") {
            closeAll();
        } else if (verb == "counts") {
            const std::lock_guard lock(m_mutex);
            m_store.printCounts(m_handshakes, m_bytes, m_resumed);
        }
    }

private:
    void serve(int connection)
    {
        const int yes = 1;
        setsockopt(connection, IPPROTO_TCP, TCP_NODELAY, &yes, sizeof yes);
        TlsStream stream(m_context, connection);
        if (stream.isOpen()) {
            {
                const std::lock_guard lock(m_mutex);
                ++m_handshakes;
                m_resumed += stream.isResumed() ? 1 : 0;
                m_connections.insert(connection);
            }
            serve(stream);
            const std::lock_guard lock(m_mutex);
            m_connections.erase(connection);
        }
        close(connection);
    }

    void serve(TlsStream& stream)
    {
        std::string line;
        std::string body;
        uint64_t counted = 0;
        while (stream.readRequest(line, body)) {
            if (line.find("/notification/v2/list") != std::string::npos) {
                stream.write(m_store.list());
            } else if (line.find("/notification/v2/read") != std::string::npos) {
                const auto [text, isLast] = m_store.markRead();
                stream.write(text);
                if (isLast) {
                    m_store.printDrained();
                }
            } else {
                stream.write(m_store.tips());
                std::cout << "tips " << now() << '\n' << std::flush;
            }
            const std::lock_guard lock(m_mutex);
            m_bytes += stream.bytes() - counted;
            counted = stream.bytes();
        }
    }

    void closeAll()
    {
        const std::lock_guard lock(m_mutex);
        for (const int connection : m_connections) {
            shutdown(connection, SHUT_RDWR);
        }
    }

    const TlsContext& m_context;
    int m_listener;
    MessageStore m_store;
    std::mutex m_mutex;
    std::set<int> m_connections;
    int m_handshakes = 0;
    int m_resumed = 0;
    uint64_t m_bytes = 0;
};

} // namespace

int main(int argc, char* argv[])
{
    if (argc < 5) {
        std::cerr << "usage: bench_platform PORT CERTIFICATE KEY AUTHORITY\n";
        return EXIT_FAILURE;
    }
    if (std::signal(SIGPIPE, SIG_IGN) == SIG_ERR) { // a client may have gone
        return EXIT_FAILURE;
    }
    const TlsContext context(argv[2], argv[3], argv[4]);
    FastPlatform platform(context, static_cast<uint16_t>(std::stoi(argv[1])));
    std::thread([&platform] { platform.serve(); }).detach();
    std::cout << "ready" << '\n' << std::flush;
    std::string line;
    while (std::getline(std::cin, line)) {
        platform.obey(line);
    }
    std::_Exit(EXIT_SUCCESS); // with the threads that wait for requests
}
