#include "log_sink.h"

#include <QMessageLogContext>
#include <QMutex>
#include <QString>
#include <QtEndian>

#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

#include <cerrno>

#include "journal_socket.h"

namespace {

QtMessageHandler writeToStandardError = nullptr;

/// JOURNAL_STREAM holds device and inode of the stream that the service manager has connected to the journal.
/// A child process inherits the variable even if its standard error was redirected since.
bool isStandardErrorTheJournal()
{
    struct stat stream = {};
    if (fstat(STDERR_FILENO, &stream) != 0) {
        return false;
    }
    const QByteArray own = QByteArray::number(static_cast<qulonglong>(stream.st_dev)) + ':'
        + QByteArray::number(static_cast<qulonglong>(stream.st_ino));
    return qgetenv("JOURNAL_STREAM") == own;
}

int priorityOf(QtMsgType type)
{
    switch (type) {
    case QtDebugMsg:
        return LOG_DEBUG;
    case QtInfoMsg:
        return LOG_INFO;
    case QtWarningMsg:
        return LOG_WARNING;
    case QtCriticalMsg:
        return LOG_CRIT;
    case QtFatalMsg:
        return LOG_ALERT;
    }
    return LOG_INFO;
}

/// A field in the form that allows line breaks in its value.
QByteArray field(const char* name, const QByteArray& value)
{
    QByteArray length(sizeof(quint64), Qt::Uninitialized);
    qToLittleEndian(static_cast<quint64>(value.size()), length.data());
    return QByteArray(name) + '\n' + length + value + '\n';
}

QByteArray entry(QtMsgType type, const QMessageLogContext& context, const QByteArray& line)
{
    return field("MESSAGE", line) + field("PRIORITY", QByteArray::number(priorityOf(type)))
        + field("CODE_FILE", context.file) + field("CODE_LINE", QByteArray::number(context.line))
        + field("CODE_FUNC", functionName(context.function))
        + field("SYSLOG_IDENTIFIER", program_invocation_short_name);
}

QByteArray lineOf(QtMsgType type, const QMessageLogContext& context, const QString& text)
{
    const QByteArray line = qFormatLogMessage(type, context, text).toUtf8();
    return line.constData(); // cut at a NUL byte, as Qt does on standard error
}

/// The journal, and the number of lines that it did not accept. Locked, as Qt logs from any thread.
class Journal
{
public:
    void write(QtMsgType type, const QMessageLogContext& context, const QString& text)
    {
        const QMutexLocker locker(&m_mutex);
        reportDropped();
        switch (m_socket.send(entry(type, context, lineOf(type, context, text)))) {
        case JournalSocket::Result::Taken:
            break;
        case JournalSocket::Result::Dropped:
            ++m_dropped;
            break;
        case JournalSocket::Result::Gone:
            writeToStandardError(type, context, text);
            break;
        }
    }

private:
    void reportDropped()
    {
        const QByteArray line =
            QByteArray::number(m_dropped) + " log lines are lost, the journal did not take them";
        if (m_dropped > 0
            && m_socket.send(entry(QtWarningMsg, QMessageLogContext(), line))
                == JournalSocket::Result::Taken) {
            m_dropped = 0;
        }
    }

    QMutex m_mutex;
    JournalSocket m_socket;
    int m_dropped = 0;
};

void writeToJournal(QtMsgType type, const QMessageLogContext& context, const QString& text)
{
    static Journal& journal = *new Journal; // never destroyed: destructors of other objects may log
    journal.write(type, context, text);
}

} // namespace

void sendLogToJournal()
{
    if (isStandardErrorTheJournal()) {
        writeToStandardError = qInstallMessageHandler(writeToJournal);
    }
}

QByteArray functionName(const char* signature)
{
    const QByteArray whole(signature);
    const QByteArray beforeArguments = whole.left(whole.indexOf('('));
    return beforeArguments.mid(beforeArguments.lastIndexOf(' ') + 1);
}
