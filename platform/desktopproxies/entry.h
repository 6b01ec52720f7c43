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
/// Docks announce changes in different ways: by the standard signal of properties, with the value or without
/// it, or by signals of the entry's own. Each change is signalled once, with the value that was announced; a
/// value that a dock only declares invalid is read without waiting.
///
/// While the program is busy, announcements wait. Those about an entry that is only built and read afterwards
/// are older than what was read, and are dropped; every later one is signalled, whatever else is read or
/// built meanwhile. Until the event loop runs for the first time Qt holds all signals back, so what is
/// announced between the first entry's subscription and an entry's own reading, some milliseconds, may be
/// signalled although the value read includes it.
// NOLINTNEXTLINE(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)
class __Entry : public QObject, private EntryListener
{
    Q_OBJECT

public:
    static const char* staticInterfaceName() { return "com.norix.kpx.daemon.Dock.Entry"; }

    /// Asks the dock for the entry's identifier, for the D-Bus time limit at most.
    __Entry(const QString& service, const QString& path, const QDBusConnection& connection,
            QObject* parent = nullptr);
    ~__Entry() override;
    Q_DISABLE_COPY_MOVE(__Entry)

    /// Whether the entry was there when the proxy was built. A dock that refused to answer, or was too slow,
    /// has the entry all the same.
    bool isValid() const;

    /// The identifier never changes, so it is read again only if the dock did not tell it before.
    QString id();

    /// These read the dock's value now. They and id() wait for the D-Bus time limit at most and are empty or
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
    void hear(const QString& property, const QVariant& value);
    void readAgain(const QString& property);
    void notice(const QString& property, const QVariant& value);
    void noticeWindowInfos(const WindowInfoMap& infos);
    void noticeName(const QString& name);

    desktopproxies::RemoteObject m_object;
    std::shared_ptr<EntrySignals> m_signals;
    bool m_isValid = true;
    std::optional<QString> m_id; ///< unset until the dock has told it
    // What has been read or signalled already.
    std::optional<QString> m_knownName;
    std::optional<QList<uint>> m_knownWindows;
    /// By property: how many readings still have announcements older than themselves in the queue.
    QHash<QString, int> m_queuedBefore;
    /// Properties that are being read, and whether they have changed once more meanwhile. One read at a time
    /// keeps a dock that declares faster than it answers from filling the memory.
    QHash<QString, bool> m_reads;
};
