#pragma once

#include <QDBusConnection>
#include <QMultiHash>
#include <QObject>

#include <functional>
#include <memory>

class QDBusMessage;

/// Receives a dock's announcements about one entry.
class EntryListener
{
public:
    /// The standard PropertiesChanged.
    virtual void onPropertiesChanged(const QDBusMessage& signal) = 0;
    /// A signal of the entry's own interface.
    virtual void onOwnSignal(const QDBusMessage& signal) = 0;

protected:
    EntryListener() = default;
    ~EntryListener() = default;
    Q_DISABLE_COPY_MOVE(EntryListener)
};

/// Passes a dock's signals to the entries' listeners. There are only two subscriptions, however many entries
/// there are: Qt compares each signal with every subscription of a program.
class EntrySignals : public QObject
{
    Q_OBJECT

public:
    /// The shared instance for a dock on a bus and its entries' interface; it lives as long as it is
    /// referenced.
    static std::shared_ptr<EntrySignals> of(const QDBusConnection& bus, const QString& service,
                                            const QString& interface);

    void add(const QString& path, EntryListener* listener);
    void remove(const QString& path, EntryListener* listener);

private Q_SLOTS:
    void onPropertiesChanged(const QDBusMessage& signal);
    void onOwnSignal(const QDBusMessage& signal);

private:
    EntrySignals(QDBusConnection bus, const QString& service, const QString& interface);

    void forEachListener(const QString& path, const std::function<void(EntryListener&)>& call);

    QMultiHash<QString, EntryListener*> m_listeners; ///< by the entry's path
};
