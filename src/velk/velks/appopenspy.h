#pragma once

#include <QList>
#include <QMap>
#include <QObject>
#include <QSharedPointer>

class QDBusObjectPath;
class __Dock; // NOLINT(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)

namespace velk::module::software {

class EntryInfo;

/// Follows the dock's entries and tells of every application opened (1) or closed (2). A dock that is absent
/// at the start is waited for; one that goes away later is not.
///
/// What is open already when the spy is built is told of when the event loop first runs, before anything that
/// happens later, so that whoever asked for the instance can connect to it.
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

    void initAll();
    void tellOpened(const QSharedPointer<EntryInfo>& entry);
    void tellFirstOpened();

    __Dock* m_dock = nullptr;
    QMap<QString, QSharedPointer<EntryInfo>> m_entries;
    bool m_isBuilt = false;
    QList<QSharedPointer<EntryInfo>>
        m_firstOpened; ///< found before anybody could listen, in the dock's order
};

} // namespace velk::module::software
