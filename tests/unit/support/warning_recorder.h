#pragma once

#include <QMutex>
#include <QStringList>
#include <QtGlobal>

/// Keeps the warnings that the program logs while the recorder lives, on any thread, instead of printing
/// them. One recorder at a time.
class WarningRecorder
{
public:
    WarningRecorder()
    {
        s_current = this;
        s_previous = qInstallMessageHandler(record);
    }
    ~WarningRecorder() { qInstallMessageHandler(s_previous); }
    Q_DISABLE_COPY_MOVE(WarningRecorder)

    QStringList texts() const
    {
        const QMutexLocker locker(&m_mutex);
        return m_texts;
    }

private:
    static void record(QtMsgType type, const QMessageLogContext& context, const QString& text)
    {
        if (type != QtWarningMsg) {
            s_previous(type, context, text);
            return;
        }
        const QMutexLocker locker(&s_current->m_mutex);
        s_current->m_texts << text;
    }

    inline static WarningRecorder* s_current = nullptr;
    inline static QtMessageHandler s_previous = nullptr;

    mutable QMutex m_mutex;
    QStringList m_texts;
};
