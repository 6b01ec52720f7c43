#pragma once

#include <QStringList>
#include <QtGlobal>

/// Keeps all that the program logs while the recorder lives, instead of printing it. One recorder at a time,
/// on the main thread.
class LogRecorder
{
public:
    LogRecorder()
    {
        s_current = this;
        m_previous = qInstallMessageHandler(record);
    }
    ~LogRecorder() { qInstallMessageHandler(m_previous); }
    Q_DISABLE_COPY_MOVE(LogRecorder)

    /// Each line with its level before it, as in "warning: text".
    QStringList lines() const { return m_lines; }

private:
    static void record(QtMsgType type, const QMessageLogContext& context, const QString& text)
    {
        switch (type) {
        case QtDebugMsg:
            s_current->m_lines << QStringLiteral("debug: ") + text;
            break;
        case QtInfoMsg:
            s_current->m_lines << QStringLiteral("info: ") + text;
            break;
        case QtWarningMsg:
            s_current->m_lines << QStringLiteral("warning: ") + text;
            break;
        default:
            s_current->m_previous(type, context, text);
        }
    }

    inline static LogRecorder* s_current = nullptr;

    QtMessageHandler m_previous = nullptr;
    QStringList m_lines;
};
