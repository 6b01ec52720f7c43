#pragma once

#include <QDBusConnection>
#include <QMultiHash>
#include <QObject>

#include <functional>
#include <memory>

class QDBusMessage;
class __Entry; // NOLINT(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)

/// Passes the changes that a dock announces on to the proxies of the entries that they are about. However
/// many entries there are, there are only two subscriptions: Qt tries each of a program's on every signal.
class EntrySignals : public QObject
{
    Q_OBJECT

public:
    /// The one of a dock on a bus. It lasts as long as somebody holds it.
    static std::shared_ptr<EntrySignals> of(const QDBusConnection& bus, const QString& service);

    void add(const QString& path, __Entry* entry);
    void remove(const QString& path, __Entry* entry);

    /// To be called whenever a value was read: what the dock announced before is then older than what was
    /// read, but is passed on only when the event loop runs.
    void catchUp();

    /// Whether some of what is passed on may be older than what was read last.
    bool isCatchingUp() const;

private Q_SLOTS:
    void onPropertiesChanged(const QDBusMessage& signal);
    void onOwnSignal(const QDBusMessage& signal);

private:
    EntrySignals(const QDBusConnection& bus, const QString& service);

    void askBus();
    void forEachEntry(const QString& path, const std::function<void(__Entry&)>& call);

    QDBusConnection m_bus;
    QMultiHash<QString, __Entry*> m_entries; ///< by path
    bool m_isCatchingUp = false;
    bool m_wasReadMeanwhile = false;
};
