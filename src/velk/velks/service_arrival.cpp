#include "service_arrival.h"

#include <QDBusConnection>

#include "remote_object.h"

ServiceArrival::ServiceArrival(const QString& service, QObject* parent)
    : QObject(parent)
    , m_watcher(service, QDBusConnection::sessionBus(),
                QDBusServiceWatcher::WatchForRegistration | QDBusServiceWatcher::WatchForUnregistration)
{
    connect(&m_watcher, &QDBusServiceWatcher::serviceRegistered, this, &ServiceArrival::emitOnce);
    // The service may have appeared before the watcher was ready.
    if (isOnBus(QDBusConnection::sessionBus(), service)) {
        QMetaObject::invokeMethod(this, &ServiceArrival::emitOnce, Qt::QueuedConnection);
    }
}

void ServiceArrival::emitOnce()
{
    if (m_hasEmitted) {
        return;
    }
    m_hasEmitted = true;
    deleteLater();
    Q_EMIT arrived();
}
