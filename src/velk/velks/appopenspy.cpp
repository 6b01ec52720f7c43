#include "appopenspy.h"

#include <QDBusConnection>
#include <QDBusObjectPath>
#include <QDebug>
#include <QStringList>

#include <memory>
#include <utility>

#include "dock.h"
#include "entryinfo.h"
#include "service_arrival.h"
#include "services.h"

namespace velk::module::software {

namespace {

__Dock* newDock(QObject* parent)
{
    return new __Dock(service::kDock, QStringLiteral("/com/norix/kpx/daemon/Dock"),
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
    // Queued before the dock's signals are connected, so it also runs before them.
    const auto alreadyOpen = std::make_shared<QStringList>();
    const auto reportAlreadyOpen = [this, alreadyOpen] {
        for (const QString& appName : *alreadyOpen) {
            reportOpened(appName);
        }
    };
    QMetaObject::invokeMethod(this, reportAlreadyOpen, Qt::QueuedConnection);

    m_dock = newDock(this);
    if (m_dock->isValid()) {
        initAll([alreadyOpen](const QString& appName) { alreadyOpen->append(appName); });
        return;
    }
    delete std::exchange(m_dock, nullptr);
    qWarning() << "dock service is not registered, wait..";
    connect(new ServiceArrival(service::kDock, this), &ServiceArrival::arrived, this, [this] {
        m_dock = newDock(this);
        initAll([this](const QString& appName) { reportOpened(appName); });
    });
}

void AppOpenSpy::initAll(const ReportOpened& report)
{
    connect(m_dock, &__Dock::EntryAdded, this, &AppOpenSpy::onEntryAdded);
    connect(m_dock, &__Dock::EntryRemoved, this, &AppOpenSpy::onEntryRemoved);

    const QList<QDBusObjectPath> paths = m_dock->entries();
    qInfo() << "dock entry size:" << paths.size();
    for (const QDBusObjectPath& path : paths) {
        addEntry(path, report);
    }
}

void AppOpenSpy::onEntryAdded(const QDBusObjectPath& path)
{
    addEntry(path, [this](const QString& appName) { reportOpened(appName); });
}

void AppOpenSpy::addEntry(const QDBusObjectPath& path, const ReportOpened& report)
{
    const auto entry = QSharedPointer<EntryInfo>::create(path);
    if (m_entries.contains(entry->entryId())) {
        qWarning() << "repeat entry added, path:" << path.path();
    }
    m_entries.insert(entry->entryId(), entry);
    // A docked entry exists whether or not its application runs.
    if (!entry->isDocked()) {
        report(entry->appName());
    }
    connect(entry.data(), &EntryInfo::windowSizeChanged, this, &AppOpenSpy::appStateChange);
}

void AppOpenSpy::reportOpened(const QString& appName)
{
    Q_EMIT appStateChange(AppOpened, appName);
}

void AppOpenSpy::onEntryRemoved(const QString& id)
{
    const QSharedPointer<EntryInfo> entry = m_entries.value(id);
    if (entry.isNull()) {
        // Keep the misspelling: fleets search their logs for it.
        qWarning() << "unknow entry removed, id:" << id;
        return;
    }
    if (entry->winSize() >= 1) {
        Q_EMIT appStateChange(AppClosed, entry->appName());
    }
    m_entries.remove(id);
}

} // namespace velk::module::software
