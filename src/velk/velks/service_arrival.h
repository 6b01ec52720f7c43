#pragma once

#include <QDBusServiceWatcher>
#include <QObject>

/// Waits for a service of the session bus that was just found absent, emits arrived() once, from the event
/// loop, and then deletes itself. The service may be gone again by then.
class ServiceArrival : public QObject
{
    Q_OBJECT

public:
    ServiceArrival(const QString& service, QObject* parent);

Q_SIGNALS:
    void arrived();

private:
    void emitOnce();

    QDBusServiceWatcher m_watcher;
    bool m_hasEmitted = false;
};
