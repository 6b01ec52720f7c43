#pragma once

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusVirtualObject>
#include <QThread>

#include <functional>
#include <memory>

/// A service on a bus that records each call it is sent and answers it with a given function. It has a
/// connection and a thread of its own, so that the code under test may block on it.
class RecordedService
{
public:
    using Answer = std::function<QDBusMessage(const QDBusMessage& call)>;

    /// Owns the name when the constructor returns. An answer of type InvalidMessage sends no reply: the
    /// service hangs.
    RecordedService(QDBusConnection::BusType bus, const QString& name, Answer answer);
    /// The name is free when the destructor returns.
    ~RecordedService();
    RecordedService(const RecordedService&) = delete;
    RecordedService& operator=(const RecordedService&) = delete;

    QList<QDBusMessage> calls() const;

    /// Sends a signal and returns once the receiver's main thread has handled it, as far as it is listened
    /// to.
    void emitSignal(const QDBusMessage& signal, const QDBusConnection& receiver) const;

    /// Sends a reply that was held back.
    void send(const QDBusMessage& reply) const { QDBusConnection(m_connectionName).send(reply); }

private:
    class Object;

    QString m_connectionName;
    QString m_name;
    QThread m_thread;
    std::unique_ptr<Object> m_object;
};
Q_DECLARE_METATYPE(RecordedService::Answer)

/// Answers every call without values.
QDBusMessage answerNothing(const QDBusMessage& call);
/// Answers no call at all.
QDBusMessage neverAnswer(const QDBusMessage& call);
RecordedService::Answer answerWith(const QVariant& value);
RecordedService::Answer answerError(const QString& name, const QString& text);

QDBusMessage signalOf(const QString& path, const QString& interface, const char* member,
                      const QVariantList& arguments = {});
