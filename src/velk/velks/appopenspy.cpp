#include "appopenspy.h"

#include <QDBusConnection>
#include <QDBusObjectPath>
#include <QDebug>

#include <utility>

#include "dock.h"
#include "entryinfo.h"
#include "service_arrival.h"

namespace velk::module::software {

namespace {

const QString kDockService = QStringLiteral("com.norix.kpx.daemon.Dock");

__Dock* newDock(QObject* parent)
{
    return new __Dock(kDockService, QStringLiteral("/com/norix/kpx/daemon/Dock"),
                      QDBusConnection::sessionBus(), parent);
}

} // namespace

AppOpenSpy* AppOpenSpy::instance()
{
    static AppOpenSpy instance;
    return &instance;
}

AppOpenSpy::AppOpenSpy()
{
    // Queued before the dock is listened to, so that it also runs before any of the dock's signals.
    QMetaObject::invokeMethod(this, &AppOpenSpy::tellFirstOpened, Qt::QueuedConnection);

    m_dock = newDock(this);
    if (m_dock->isValid()) {
        initAll();
    } else {
        delete std::exchange(m_dock, nullptr);
        qWarning() << "dock service is not registered, wait..";
        connect(new ServiceArrival(kDockService, this), &ServiceArrival::arrived, this, [this] {
            m_dock = newDock(this);
            initAll();
        });
    }
    m_isBuilt = true;
}

void AppOpenSpy::initAll()
{
    connect(m_dock, &__Dock::EntryAdded, this, &AppOpenSpy::onEntryAdded);
    connect(m_dock, &__Dock::EntryRemoved, this, &AppOpenSpy::onEntryRemoved);

    const QList<QDBusObjectPath> paths = m_dock->entries();
    qInfo() << "dock entry size:" << paths.size();
    for (const QDBusObjectPath& path : paths) {
        onEntryAdded(path);
    }
}

void AppOpenSpy::onEntryAdded(const QDBusObjectPath& path)
{
    const auto entry = QSharedPointer<EntryInfo>::create(path);
    if (m_entries.contains(entry->entryId())) {
        qWarning() << "repeat entry added, path:" << path.path();
    }
    m_entries.insert(entry->entryId(), entry);
    // A docked entry stands on the dock whether or not its application runs.
    if (!entry->isDocked()) {
        tellOpened(entry);
    }
    connect(entry.data(), &EntryInfo::windowSizeChanged, this, &AppOpenSpy::appStateChange);
}

void AppOpenSpy::onEntryRemoved(const QString& id)
{
    const QSharedPointer<EntryInfo> entry = m_entries.value(id);
    if (entry.isNull()) {
        // The misspelling is intended: fleets search their logs for it.
        qWarning() << "unknow entry removed, id:" << id;
        return;
    }
    if (entry->winSize() >= 1) {
        Q_EMIT appStateChange(AppClosed, entry->appName());
    }
    m_entries.remove(id);
}

void AppOpenSpy::tellOpened(const QSharedPointer<EntryInfo>& entry)
{
    if (m_isBuilt) {
        Q_EMIT appStateChange(AppOpened, entry->appName());
    } else {
        m_firstOpened.append(entry);
    }
}

void AppOpenSpy::tellFirstOpened()
{
    for (const auto& entry : std::exchange(m_firstOpened, {})) {
        Q_EMIT appStateChange(AppOpened, entry->appName());
    }
}

} // namespace velk::module::software
