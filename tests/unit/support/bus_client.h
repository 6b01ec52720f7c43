#pragma once

#include <QCoreApplication>
#include <QDBusConnection>
#include <QDBusConnectionInterface>
#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QSignalSpy>
#include <QUuid>

/// One program on the test's session bus: a connection of its own, so that a single test program can play
/// several programs that talk to each other. Leaves the bus when it is destroyed.
class BusClient
{
public:
    BusClient()
        : m_bus(QDBusConnection::connectToBus(QDBusConnection::SessionBus, QUuid::createUuid().toString()))
    { }
    ~BusClient() { QDBusConnection::disconnectFromBus(m_bus.name()); }
    Q_DISABLE_COPY_MOVE(BusClient)

    QDBusConnection& bus() { return m_bus; }
    QString uniqueName() const { return m_bus.baseService(); }

    /// Returns once the bus has carried out what this client asked it so far, match rules included.
    void settle() { ping(QStringLiteral("org.freedesktop.DBus")); }

    /// Returns once the receiver has delivered everything that this client sent it so far: the bus keeps the
    /// order of what goes from one client to another, so the answer to a ping comes after all of it.
    void deliverTo(const BusClient& receiver)
    {
        ping(receiver.uniqueName());
        QCoreApplication::sendPostedEvents();
    }

private:
    void ping(const QString& service)
    {
        m_bus.call(QDBusMessage::createMethodCall(service, QStringLiteral("/org/freedesktop/DBus"),
                                                  QStringLiteral("org.freedesktop.DBus.Peer"),
                                                  QStringLiteral("Ping")));
    }

    QDBusConnection m_bus;
};

/// Waits, with the event loop running, for the call's reply or error; false when neither came.
inline bool finished(const QDBusPendingCall& call)
{
    const QDBusPendingCallWatcher watcher(call);
    QSignalSpy spy(&watcher, &QDBusPendingCallWatcher::finished);
    return watcher.isFinished() || spy.wait();
}
