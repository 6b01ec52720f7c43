#pragma once

#include <QDBusMessage>
#include <QHash>
#include <QObject>
#include <QVariant>

#include <optional>

#include "remote_interface.h"
#include "types.h"

/// Proxy of one entry of the desktop's dock. The desktop's library gives its proxies names with underscores.
///
/// Docks announce changes in different ways: by the standard signal of properties, with the value or without
/// it, or by signals of the entry's own. Each change is signalled once, with the value that was announced; a
/// value that a dock only declares invalid is read without waiting.
///
/// Each proxy has subscriptions of its own, made when it is built. What was announced about the entry before
/// that never reaches it, however long the program was busy; what is announced from then on always does, in
/// the dock's order. What falls between the subscription and a reading, a few milliseconds, may be signalled
/// although the value read includes it. The same holds for a further proxy of the same entry where Qt has
/// held signals back because the event loop has not run yet.
// NOLINTNEXTLINE(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)
class __Entry : public QObject
{
    Q_OBJECT

public:
    static const char* staticInterfaceName() { return "com.norix.kpx.daemon.Dock.Entry"; }

    /// Asks the dock for the entry's identifier, for the D-Bus time limit at most.
    __Entry(const QString& service, const QString& path, const QDBusConnection& connection,
            QObject* parent = nullptr);

    /// Whether the entry was there when the proxy was built. A dock that refused to answer, or was too slow,
    /// has the entry all the same.
    bool isValid() const;

    /// The identifier never changes, so it is read again only if the dock did not tell it before.
    QString id() const;

    /// These read the dock's value now. They and id() wait for the D-Bus time limit at most and are empty or
    /// false if the dock does not answer.
    QString name() const;
    bool isDocked() const;
    WindowInfoMap windowInfos() const;

Q_SIGNALS:
    void WindowInfosChanged(const QMap<uint, WindowInfo>& infos);
    void NameChanged(const QString& name);

private Q_SLOTS:
    void onPropertiesChanged(const QDBusMessage& signal);
    void onOwnSignal(const QDBusMessage& signal);

private:
    void subscribe();
    void readAgain(const QString& property);
    void notice(const QString& property, const QVariant& value);
    void noticeWindowInfos(const WindowInfoMap& infos);
    void noticeName(const QString& name);

    RemoteInterface m_object;
    bool m_isValid = true;
    mutable std::optional<QString> m_id; ///< unset until the dock has told it
    // What has been read or signalled already.
    mutable std::optional<QString> m_knownName;
    mutable std::optional<QList<uint>> m_knownWindows;
    /// Properties that are being read, and whether they have changed once more meanwhile. One read at a time
    /// keeps a dock that declares faster than it answers from filling the memory.
    QHash<QString, bool> m_reads;
};
