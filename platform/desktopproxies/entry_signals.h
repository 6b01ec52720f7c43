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

private Q_SLOTS:
    void onPropertiesChanged(const QDBusMessage& signal);
    void onOwnSignal(const QDBusMessage& signal);

private:
    EntrySignals(const QDBusConnection& bus, const QString& service);

    void forEachEntry(const QString& path, const std::function<void(__Entry&)>& call);

    QMultiHash<QString, __Entry*> m_entries; ///< by path
};
