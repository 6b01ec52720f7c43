#pragma once

#include <QByteArray>

/// The journal's own socket. libsystemd's functions block while a hung journal accepts nothing, which would
/// block all policies.
class JournalSocket
{
public:
    enum class Result {
        Taken,
        Dropped, ///< the journal is there but accepts nothing
        Gone, ///< there is no journal
    };

    JournalSocket() = default;
    ~JournalSocket();
    Q_DISABLE_COPY_MOVE(JournalSocket)

    /// Sends one entry in the journal's native protocol. If the journal has no room, waits 100 ms for it.
    /// After a wait in vain, drops entries without waiting until the journal accepts one again.
    Result send(const QByteArray& entry);

private:
    bool open();
    void close();
    Result attempt(const QByteArray& entry);

    int m_socket = -1;
    bool m_isHanging = false;
};
