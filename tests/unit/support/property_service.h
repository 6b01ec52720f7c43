#pragma once

#include <QDBusVariant>
#include <QMap>
#include <QVariant>

#include <algorithm>
#include <atomic>
#include <mutex>

#include "recorded_service.h"

/// A service on the session bus whose objects have properties. Values may change while it runs.
class PropertyService
{
public:
    explicit PropertyService(const QString& name)
        : m_service(QDBusConnection::SessionBus, name,
                    [this](const QDBusMessage& call) { return answer(call); })
    { }

    /// What was never set is answered with an error.
    void set(const QString& path, const QString& property, const QVariant& value)
    {
        const std::lock_guard lock(m_mutex);
        m_values[path + property] = value;
    }

    /// From now on no call is answered.
    void hang() { m_hangs = true; }

    /// Answers the calls that wait, and later ones.
    void answerAgain()
    {
        m_hangs = false;
        const std::lock_guard lock(m_mutex);
        for (const QDBusMessage& call : qAsConst(m_waiting)) {
            m_service.send(valueFor(call));
        }
        m_waiting.clear();
    }

    /// How often the property of the object was read.
    int reads(const QString& path, const QString& property) const
    {
        const QList<QDBusMessage> calls = m_service.calls();
        return static_cast<int>(std::count_if(calls.cbegin(), calls.cend(), [&](const QDBusMessage& call) {
            return call.path() == path && call.arguments().value(1).toString() == property;
        }));
    }

    const RecordedService& service() const { return m_service; }

private:
    QDBusMessage answer(const QDBusMessage& call)
    {
        const std::lock_guard lock(m_mutex);
        if (m_hangs) {
            m_waiting.append(call);
            return {};
        }
        return valueFor(call);
    }

    QDBusMessage valueFor(const QDBusMessage& call) const
    {
        const QVariant value = m_values.value(call.path() + call.arguments().value(1).toString());
        return value.isValid() ? call.createReply(QVariant::fromValue(QDBusVariant(value)))
                               : call.createErrorReply(QDBusError::UnknownObject, QStringLiteral("unknown"));
    }

    mutable std::mutex m_mutex; // see RecordedService
    QMap<QString, QVariant> m_values;
    QList<QDBusMessage> m_waiting;
    std::atomic_bool m_hangs = false;
    RecordedService m_service;
};
