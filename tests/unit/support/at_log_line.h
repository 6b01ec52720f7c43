#pragma once

#include <QtGlobal>

#include <functional>

/// Does something at the moment at which the program logs a line that contains a text. One at a time.
class AtLogLine
{
public:
    AtLogLine(const char* text, std::function<void()> action)
    {
        s_text = QString::fromLatin1(text);
        s_action = std::move(action);
        s_previous = qInstallMessageHandler(handle);
    }
    ~AtLogLine() { qInstallMessageHandler(s_previous); }
    Q_DISABLE_COPY_MOVE(AtLogLine)

private:
    static void handle(QtMsgType type, const QMessageLogContext& context, const QString& text)
    {
        s_previous(type, context, text);
        if (text.contains(s_text)) {
            s_action();
        }
    }

    inline static QString s_text;
    inline static std::function<void()> s_action;
    inline static QtMessageHandler s_previous = nullptr;
};
