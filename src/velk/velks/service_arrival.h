#pragma once

#include <QDBusServiceWatcher>
#include <QObject>

/// Waits for a service of the session bus that was absent a moment ago, tells once from the event loop that
/// it has arrived, and then deletes itself. Whether it stays is not looked at.
class ServiceArrival : public QObject
{
    Q_OBJECT

public:
    ServiceArrival(const QString& service, QObject* parent);

Q_SIGNALS:
    void arrived();

private:
    void tellOnce();

    QDBusServiceWatcher m_watcher;
    bool m_told = false;
};
