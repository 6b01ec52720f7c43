#include "recorded_service.h"

#include <QCoreApplication>
#include <QDebug>
#include <QUuid>

#include <mutex>

class RecordedService::Object : public QDBusVirtualObject
{
public:
    explicit Object(Answer answer)
        : m_answer(std::move(answer))
    { }

    /// Waits for a call that is being recorded.
    ~Object() override { const std::lock_guard lock(m_mutex); }
    Q_DISABLE_COPY_MOVE(Object)

    QString introspect(const QString& /*path*/) const override { return QString(); }

    bool handleMessage(const QDBusMessage& message, const QDBusConnection& connection) override
    {
        {
            const std::lock_guard lock(m_mutex);
            m_calls.append(message);
        }
        const QDBusMessage reply = m_answer(message);
        if (reply.type() != QDBusMessage::InvalidMessage) {
            connection.send(reply);
        }
        return true;
    }

    QList<QDBusMessage> calls() const
    {
        const std::lock_guard lock(m_mutex);
        return m_calls;
    }

private:
    Answer m_answer;
    mutable std::mutex m_mutex; // ThreadSanitizer does not know Qt's
    QList<QDBusMessage> m_calls;
};

RecordedService::RecordedService(QDBusConnection::BusType bus, const QString& name, Answer answer)
    : m_connectionName(QUuid::createUuid().toString())
    , m_name(name)
    , m_object(std::make_unique<Object>(std::move(answer)))
{
    auto connection = QDBusConnection::connectToBus(bus, m_connectionName);
    connection.registerVirtualObject(QStringLiteral("/"), m_object.get(), QDBusConnection::SubPath);
    m_object->moveToThread(&m_thread);
    m_thread.start();
    if (!connection.registerService(name)) {
        qFatal("the bus gives no name %s: %s", qUtf8Printable(name),
               qUtf8Printable(connection.lastError().message()));
    }
}

RecordedService::~RecordedService()
{
    // The connection is closed later, in a thread of its own: until then it would keep the name, and it must
    // not find the object.
    QDBusConnection connection(m_connectionName);
    connection.unregisterService(m_name);
    connection.unregisterObject(QStringLiteral("/"), QDBusConnection::UnregisterTree);
    QDBusConnection::disconnectFromBus(m_connectionName);
    m_thread.quit();
    m_thread.wait();
}

QList<QDBusMessage> RecordedService::calls() const
{
    return m_object->calls();
}

void RecordedService::emitSignal(const QDBusMessage& signal, const QDBusConnection& receiver) const
{
    const QDBusConnection connection(m_connectionName);
    connection.send(signal);
    // The bus keeps the order, so the answer to a ping comes after the signal.
    connection.call(QDBusMessage::createMethodCall(receiver.baseService(), QStringLiteral("/"),
                                                   QStringLiteral("org.freedesktop.DBus.Peer"),
                                                   QStringLiteral("Ping")));
    QCoreApplication::sendPostedEvents();
}

QDBusMessage answerNothing(const QDBusMessage& call)
{
    return call.createReply();
}

QDBusMessage neverAnswer(const QDBusMessage& /*call*/)
{
    return {};
}

RecordedService::Answer answerWith(const QVariant& value)
{
    return [value](const QDBusMessage& call) { return call.createReply(value); };
}

RecordedService::Answer answerError(const QString& name, const QString& text)
{
    return [name, text](const QDBusMessage& call) { return call.createErrorReply(name, text); };
}

QDBusMessage signalOf(const QString& path, const QString& interface, const char* member,
                      const QVariantList& arguments)
{
    QDBusMessage signal = QDBusMessage::createSignal(path, interface, QString::fromLatin1(member));
    signal.setArguments(arguments);
    return signal;
}
