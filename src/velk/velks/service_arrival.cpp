#include "service_arrival.h"

#include <QDBusConnection>

#include "remote_object.h"

ServiceArrival::ServiceArrival(const QString& service, QObject* parent)
    : QObject(parent)
    , m_watcher(service, QDBusConnection::sessionBus(),
                QDBusServiceWatcher::WatchForRegistration | QDBusServiceWatcher::WatchForUnregistration)
{
    connect(&m_watcher, &QDBusServiceWatcher::serviceRegistered, this, &ServiceArrival::tellOnce);
    // It may have arrived since it was missed and before it was watched for.
    if (isOnBus(QDBusConnection::sessionBus(), service)) {
        QMetaObject::invokeMethod(this, &ServiceArrival::tellOnce, Qt::QueuedConnection);
    }
}

void ServiceArrival::tellOnce()
{
    if (m_told) {
        return;
    }
    m_told = true;
    deleteLater();
    Q_EMIT arrived();
}
