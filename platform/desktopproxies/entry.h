#pragma once

#include <QHash>
#include <QObject>
#include <QVariant>

#include <memory>
#include <optional>

#include "remote_interface.h"
#include "types.h"

class EntrySignals;

/// Proxy of one entry of the desktop's dock. The desktop's library gives its proxies names with underscores.
///
/// Docks announce changes in different ways: by the standard signal of properties, with the value or without
/// it, or by signals of the entry's own. All are listened to from the start, and each change is told once. A
/// value that a dock only declares invalid is read without waiting; so is one that it announces while older
/// announcements may still be under way (see EntrySignals::isCatchingUp()).
// NOLINTNEXTLINE(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)
class __Entry : public QObject
{
    Q_OBJECT

public:
    static const char* staticInterfaceName() { return "com.norix.kpx.daemon.Dock.Entry"; }

    /// Waits for the entry's identifier, which never changes, for the D-Bus time limit at most.
    __Entry(const QString& service, const QString& path, const QDBusConnection& connection,
            QObject* parent = nullptr);
    ~__Entry() override;
    Q_DISABLE_COPY_MOVE(__Entry)

    /// Whether the dock is there and answered for this entry when the proxy was built.
    bool isValid() const;

    QString id() const;

    /// These read the dock's value now, for the D-Bus time limit at most; empty or false if it does not
    /// answer.
    QString name() const;
    bool isDocked() const;
    WindowInfoMap windowInfos() const;

Q_SIGNALS:
    void WindowInfosChanged(const QMap<uint, WindowInfo>& infos);
    void NameChanged(const QString& name);

private:
    friend class EntrySignals;
    void onPropertiesChanged(const QVariantMap& changed, const QStringList& invalidated);
    void onOwnSignal(const QDBusMessage& signal);

    void announce(const QString& property, const QVariant& value);
    void readAgain(const QString& property);
    void tellOf(const QString& property, const QVariant& value);
    void tellOfWindowInfos(const WindowInfoMap& infos);
    void tellOfName(const QString& name);

    RemoteInterface m_object;
    std::shared_ptr<EntrySignals> m_signals;
    std::optional<QString> m_id; ///< unset if the entry did not answer
    // What the other side knows already, read or told.
    mutable std::optional<QString> m_knownName;
    mutable std::optional<QList<uint>> m_knownWindows;
    /// Properties that are being read, and whether they have changed once more meanwhile. One read at a time
    /// keeps a dock that declares faster than it answers from filling the memory.
    QHash<QString, bool> m_reads;
};
