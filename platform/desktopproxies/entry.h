#pragma once

#include <QDBusMessage>
#include <QHash>
#include <QObject>
#include <QVariant>

#include <memory>
#include <optional>

#include "entry_signals.h"
#include "remote_object.h"
#include "types.h"

/// Proxy of one entry of the desktop's dock. The desktop's library gives its proxies names with underscores.
///
/// Docks announce changes in different ways: by PropertiesChanged, with or without the value, or by signals
/// of the entry's own interface. Each change is signalled once, with the announced value; a value that a dock
/// only invalidates is read without waiting.
///
/// Announcements queue while the program is busy. Those that are older than the value that has been read are
/// dropped; every later one is signalled, whatever else is read or built meanwhile. One exception: until the
/// event loop first runs, Qt holds all signals back. What a dock announces in the milliseconds between the
/// first entry's subscription and an entry's own read may then be signalled although the value read includes
/// it.
// NOLINTNEXTLINE(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)
class __Entry : public QObject, private EntryListener
{
    Q_OBJECT

public:
    static const char* staticInterfaceName() { return "com.norix.kpx.daemon.Dock.Entry"; }

    /// Reads the entry's identifier, for the D-Bus time limit at most.
    __Entry(const QString& service, const QString& path, const QDBusConnection& connection,
            QObject* parent = nullptr);
    ~__Entry() override;
    Q_DISABLE_COPY_MOVE(__Entry)

    /// Whether the entry existed when the proxy was built. It counts as existing if the dock refused to
    /// answer or was too slow.
    bool isValid() const;

    /// The identifier never changes, so it is read again only if it could not be read before.
    QString id();

    /// These read the current value. They and id() wait for the D-Bus time limit at most, and are empty or
    /// false if the dock does not answer.
    QString name();
    bool isDocked() const;
    WindowInfoMap windowInfos();

Q_SIGNALS:
    void WindowInfosChanged(const QMap<uint, WindowInfo>& infos);
    void NameChanged(const QString& name);

private:
    void onPropertiesChanged(const QDBusMessage& signal) override;
    void onOwnSignal(const QDBusMessage& signal) override;

    QVariant readNow(const QString& property);
    QDBusPendingCallWatcher* ask(const QString& property);
    void receive(const QString& property, const QVariant& value);
    void readAgain(const QString& property);
    void notice(const QString& property, const QVariant& value);
    void noticeWindowInfos(const WindowInfoMap& infos);
    void noticeName(const QString& name);

    desktopproxies::RemoteObject m_object;
    std::shared_ptr<EntrySignals> m_signals;
    bool m_isValid = true;
    std::optional<QString> m_id; ///< unset until it has been read
    // The value last read or signalled.
    std::optional<QString> m_knownName;
    std::optional<QList<uint>> m_knownWindows;
    /// By property: how many reads still have older announcements in the queue.
    QHash<QString, int> m_queuedBefore;
    /// Properties that are being read, and whether each was invalidated again since. Only one read runs at a
    /// time, so that a dock that invalidates faster than it answers cannot fill the memory.
    QHash<QString, bool> m_reads;
};
