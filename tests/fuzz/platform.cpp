#include <QAbstractEventDispatcher>
#include <QCoreApplication>
#include <QTimerEvent>

#include "canned_platform.h"
#include "fuzzing.h"
#include "handleevent.h"
#include "message_platform.h"
#include "message_transfer.h"
#include "platform_files.h"

namespace {

// Each message is a call on the bus.
constexpr int kMostCommas = 64;

/// A reply is its header lines, an empty line and its body.
CannedReply replyOf(const QByteArray& input)
{
    const int end = input.indexOf("\n\n");
    CannedReply reply{200, QString::fromUtf8(input.mid(end + 2)), {}};
    const QList<QByteArray> lines = input.left(end).split('\n');
    for (const QByteArray& line : lines) {
        const int colon = line.indexOf(':');
        reply.headers.append({line.left(colon), line.mid(colon + 1)});
    }
    return reply;
}

/// Lets every timer be due: the notices come that wait for their minute, and the next poll.
void endWaiting()
{
    auto* dispatcher = QAbstractEventDispatcher::instance();
    const QObjectList waiting = dispatcher->children();
    for (QObject* timer : waiting) {
        const auto timers = dispatcher->registeredTimers(timer);
        for (const auto& info : timers) {
            QTimerEvent due(info.timerId);
            QCoreApplication::sendEvent(timer, &due);
        }
    }
}

} // namespace

/// The platform's reply to the password tips, which is also taken for a list of messages.
void tryInput(const QByteArray& input)
{
    static const bool prepared = (writePlatformAddress("localhost", "1"), true);
    static MessageTransfer transfer;
    static MessagePlatform platform(nullptr, QStringLiteral("zhang.wei"), &transfer);
    if (!prepared || input.count(',') > kMostCommas) {
        return;
    }
    setNextReply(replyOf(input));
    HandleEvent::GetInstance()->getPasswdExpiredTime(QString(), QStringLiteral("zhang.wei"));
    endWaiting();
}
