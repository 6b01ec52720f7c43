#include "journal_socket.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/mman.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <string_view>

namespace {

constexpr std::string_view kPath = "/run/systemd/journal/socket";
constexpr int kBurstBytes = 8 * 1024 * 1024; // the send buffer, as large as libsystemd's
constexpr int kLongestWaitMs = 100;

bool sendMessage(int socket, const msghdr& message)
{
    return sendmsg(socket, &message, MSG_NOSIGNAL | MSG_DONTWAIT) >= 0;
}

bool sendAsDatagram(int socket, const QByteArray& entry)
{
    iovec content{const_cast<char*>(entry.constData()), static_cast<size_t>(entry.size())};
    msghdr message{};
    message.msg_iov = &content;
    message.msg_iovlen = 1;
    return sendMessage(socket, message);
}

/// An entry too long for a datagram is passed as a memory file that is sealed against changes.
bool sendAsFile(int socket, const QByteArray& entry)
{
    const int file = memfd_create("journal-entry", MFD_CLOEXEC | MFD_ALLOW_SEALING);
    const bool isWhole = file >= 0
        && write(file, entry.constData(), static_cast<size_t>(entry.size())) == entry.size()
        && fcntl(file, F_ADD_SEALS, F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_WRITE | F_SEAL_SEAL) == 0;
    alignas(cmsghdr) std::array<char, CMSG_SPACE(sizeof(int))> handed{};
    msghdr message{};
    message.msg_control = handed.data();
    message.msg_controllen = handed.size();
    cmsghdr* header = CMSG_FIRSTHDR(&message);
    header->cmsg_level = SOL_SOCKET;
    header->cmsg_type = SCM_RIGHTS;
    header->cmsg_len = CMSG_LEN(sizeof(int));
    std::memcpy(CMSG_DATA(header), &file, sizeof(int));
    const bool isSent = isWhole && sendMessage(socket, message);
    const int error = errno;
    if (file >= 0) {
        ::close(file);
    }
    errno = error;
    return isSent;
}

bool sendEntry(int socket, const QByteArray& entry)
{
    if (sendAsDatagram(socket, entry)) {
        return true;
    }
    return (errno == EMSGSIZE || errno == ENOBUFS) && sendAsFile(socket, entry);
}

bool waitForRoom(int socket)
{
    pollfd room{socket, POLLOUT, 0};
    return poll(&room, 1, kLongestWaitMs) > 0;
}

} // namespace

JournalSocket::~JournalSocket()
{
    close();
}

JournalSocket::Result JournalSocket::send(const QByteArray& entry)
{
    Result result = attempt(entry);
    if (result == Result::Gone) {
        close(); // a restarted journal may have a new socket at the same path
        result = attempt(entry);
    }
    return result;
}

JournalSocket::Result JournalSocket::attempt(const QByteArray& entry)
{
    if (m_socket < 0 && !open()) {
        return Result::Gone;
    }
    bool isTaken = sendEntry(m_socket, entry);
    if (!isTaken && errno == EAGAIN && !m_isHanging && waitForRoom(m_socket)) {
        isTaken = sendEntry(m_socket, entry);
    }
    m_isHanging = !isTaken && errno == EAGAIN;
    if (isTaken) {
        return Result::Taken;
    }
    return m_isHanging ? Result::Dropped : Result::Gone;
}

bool JournalSocket::open()
{
    m_socket = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    kPath.copy(static_cast<char*>(address.sun_path), kPath.size());
    // Only on a connected socket does poll() wait until the receiver has room.
    if (m_socket < 0
        || connect(m_socket, reinterpret_cast<const sockaddr*>(&address), sizeof(address)) != 0) {
        close();
        return false;
    }
    setsockopt(m_socket, SOL_SOCKET, SO_SNDBUF, &kBurstBytes, sizeof(kBurstBytes));
    return true;
}

void JournalSocket::close()
{
    if (m_socket >= 0) {
        ::close(m_socket);
        m_socket = -1;
    }
}
