#include "bus_watch.h"

#include <QCoreApplication>
#include <QDBusConnection>
#include <QDebug>

#include <cstdlib>
#include <utility>

BusWatch::BusWatch(QDBusConnection bus, const QString& kind)
    : m_kind(kind)
{
    // The D-Bus library itself sends this signal. Buses pass on nothing from this path, so others cannot
    // forge it.
    const QString anyService;
    const bool isWatched = bus.connect(anyService, QStringLiteral("/org/freedesktop/DBus/Local"),
                                       QStringLiteral("org.freedesktop.DBus.Local"),
                                       QStringLiteral("Disconnected"), this, SLOT(endProgram()));
    // Checked after connecting: the bus may have gone just before.
    if (!isWatched || !bus.isConnected()) {
        QMetaObject::invokeMethod(this, &BusWatch::endProgram, Qt::QueuedConnection);
    }
}

void BusWatch::endProgram()
{
    if (std::exchange(m_isEnding, true)) {
        return;
    }
    qCritical("no connection to the %s bus, ending", qUtf8Printable(m_kind));
    QCoreApplication::exit(EXIT_FAILURE);
}
