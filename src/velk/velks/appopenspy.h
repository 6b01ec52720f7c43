#pragma once

#include <QMap>
#include <QObject>
#include <QSharedPointer>

#include <functional>

class QDBusObjectPath;
class __Dock; // NOLINT(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)

namespace velk::module::software {

class EntryInfo;

/// Follows the dock's entries and reports each application opened (1) or closed (2). If the dock is absent at
/// the start, waits for it; if the dock leaves later, does not wait for it to return.
///
/// Applications already open at construction are reported when the event loop first runs, before any later
/// change, so that callers of instance() can connect first.
class AppOpenSpy : public QObject
{
    Q_OBJECT

public:
    static AppOpenSpy* instance();

Q_SIGNALS:
    void appStateChange(int type, const QString& appName);

public Q_SLOTS:
    void onEntryAdded(const QDBusObjectPath& path);
    void onEntryRemoved(const QString& id);

private:
    AppOpenSpy();

    using ReportOpened = std::function<void(const QString& appName)>;

    void initAll(const ReportOpened& report);
    void addEntry(const QDBusObjectPath& path, const ReportOpened& report);
    void reportOpened(const QString& appName);

    __Dock* m_dock = nullptr;
    QMap<QString, QSharedPointer<EntryInfo>> m_entries; ///< by the entries' identifiers
};

} // namespace velk::module::software
