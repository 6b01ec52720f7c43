#include "unread_calls.h"

#include <QDBusAbstractInterface>
#include <QDBusConnection>
#include <QDBusMessage>

#include <algorithm>
#include <numeric>

namespace {

// Half of a system bus's limit, which leaves room for calls whose replies are read.
constexpr int kMostUnanswered = 64;

// Qt keeps a call and its arguments until it is answered or times out.
constexpr int kMostCharacters = 65536;

/// The total length of the arguments' texts.
int characters(const QVariantList& arguments)
{
    return std::accumulate(arguments.cbegin(), arguments.cend(), 0, [](int sum, const QVariant& argument) {
        return sum + argument.toString().size();
    });
}

} // namespace

QDBusPendingCall UnreadCalls::send(QDBusAbstractInterface& proxy, const QString& method,
                                   const QVariantList& arguments)
{
    const auto answered = std::remove_if(m_unanswered.begin(), m_unanswered.end(),
                                         [](const QDBusPendingCall& call) { return call.isFinished(); });
    m_unanswered.erase(answered, m_unanswered.end());
    if (m_unanswered.size() < kMostUnanswered && characters(arguments) <= kMostCharacters) {
        m_unanswered.append(proxy.asyncCallWithArgumentList(method, arguments));
        return m_unanswered.last();
    }

    auto call = QDBusMessage::createMethodCall(proxy.service(), proxy.path(), proxy.interface(), method);
    call.setArguments(arguments);
    proxy.connection().send(call);
    return QDBusPendingCall::fromCompletedCall(call.createReply());
}
