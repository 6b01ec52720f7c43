#include "log_sink.h"

#include <QMessageLogContext>
#include <QString>

#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

#define SD_JOURNAL_SUPPRESS_LOCATION // the place of the log call is told, not that of this file
#include <systemd/sd-journal.h>

namespace {

QtMessageHandler writeToStandardError = nullptr;

/// The service manager names device and inode of the stream that it has connected to the journal. A child
/// process inherits the variable even where its standard error has been led elsewhere since.
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

void writeToJournal(QtMsgType type, const QMessageLogContext& context, const QString& text)
{
    const QByteArray line = qFormatLogMessage(type, context, text).toUtf8();
    const QByteArray function = functionName(context.function);
    // libsystemd's own format function cuts a text at a NUL byte, as Qt does on standard error.
    const int result =
        sd_journal_send("MESSAGE=%s", line.constData(), "PRIORITY=%i", priorityOf(type), "CODE_FILE=%s",
                        context.file != nullptr ? context.file : "", "CODE_LINE=%i", context.line,
                        "CODE_FUNC=%s", function.constData(), nullptr);
    if (result < 0) {
        writeToStandardError(type, context, text);
    }
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
