#pragma once

#include <QMutex>
#include <QRegularExpression>
#include <QStringList>
#include <QtGlobal>

/// Keeps all that the program logs while the recorder lives, on any thread, instead of printing it. One
/// recorder at a time.
class LogRecorder
{
public:
    LogRecorder()
    {
        s_current = this;
        s_previous = qInstallMessageHandler(record);
    }
    ~LogRecorder()
    {
        qInstallMessageHandler(s_previous);
        s_current = nullptr;
    }
    Q_DISABLE_COPY_MOVE(LogRecorder)

    /// Each line with its level before it, as in "warning: text".
    QStringList lines() const
    {
        const QMutexLocker locker(&m_mutex);
        return m_lines;
    }

    /// The texts of the warnings alone.
    QStringList warnings() const
    {
        const QString start = QStringLiteral("warning: ");
        QStringList texts = lines().filter(QRegularExpression(QStringLiteral("^warning: ")));
        for (QString& text : texts) {
            text.remove(0, start.size());
        }
        return texts;
    }

private:
    static void record(QtMsgType type, const QMessageLogContext& context, const QString& text)
    {
        const QString level = nameOf(type);
        if (level.isEmpty()) {
            s_previous(type, context, text);
            return;
        }
        const QMutexLocker locker(&s_current->m_mutex);
        s_current->m_lines << level + QStringLiteral(": ") + text;
    }

    /// Empty for what should end the program.
    static QString nameOf(QtMsgType type)
    {
        switch (type) {
        case QtDebugMsg:
            return QStringLiteral("debug");
        case QtInfoMsg:
            return QStringLiteral("info");
        case QtWarningMsg:
            return QStringLiteral("warning");
        default:
            return {};
        }
    }

    inline static LogRecorder* s_current = nullptr;
    inline static QtMessageHandler s_previous = nullptr;

    mutable QMutex m_mutex;
    QStringList m_lines;
};
