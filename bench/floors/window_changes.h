#pragma once

#include <QObject>

class BareDaemon;
class QDBusMessage;

/// Reports each change of a dock entry's windows to the daemon by one asynchronous call.
class WindowChanges : public QObject
{
    Q_OBJECT

public:
    explicit WindowChanges(BareDaemon& daemon);

private Q_SLOTS:
    void onChanged(const QDBusMessage& signal);

private:
    BareDaemon& m_daemon;
};
