#pragma once

#include <QByteArray>

/// The journal's own socket, without libsystemd's wait: its functions block for as long as a journal that
/// hangs takes nothing, and all policies with them.
class JournalSocket
{
public:
    enum class Result {
        Taken,
        Dropped, ///< the journal is there and takes nothing
        Gone, ///< there is no journal
    };

    JournalSocket() = default;
    ~JournalSocket();
    Q_DISABLE_COPY_MOVE(JournalSocket)

    /// Hands over one entry, in the form of the journal's native protocol. In a burst that the journal takes
    /// more slowly than it comes, this waits a moment; once that moment was in vain, entries are dropped at
    /// once until the journal takes one again.
    Result send(const QByteArray& entry);

private:
    bool open();
    void close();
    Result attempt(const QByteArray& entry);

    int m_socket = -1;
    bool m_isHanging = false;
};
