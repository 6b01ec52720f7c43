#include <QDBusVariant>
#include <QtTest>

#include <array>
#include <memory>

#include "handleevent.h"
#include "log_recorder.h"
#include "message_platform.h"
#include "message_transfer.h"
#include "platform_files.h"
#include "pretended.h"
#include "recorded_service.h"

namespace {

QTimer* pollTimerOf(const MessagePlatform& platform);

/// An explicit instantiation may name what is private. The timer has no parent, so nothing else leads to it.
using TimerOfPlatform = QTimer* MessagePlatform::*;
template <TimerOfPlatform Member> struct PollTimer
{
    friend QTimer* pollTimerOf(const MessagePlatform& platform) { return platform.*Member; }
};
template struct PollTimer<&MessagePlatform::m_timer>;

// Seconds of different days, up to the last that fits a request to the platform.
constexpr std::array<time_t, 6> kMoments = {0, 1234567890, 1800000000, 1900012345, 2147483648, 4294967295};

/// The interval that the generator gives at the pretended time.
int intervalNow(int max, int min)
{
    QT_WARNING_PUSH
    QT_WARNING_DISABLE_DEPRECATED
    qsrand(static_cast<uint>(QTime::currentTime().msecsSinceStartOfDay() / 1000));
    return qrand() % (max - min) + min;
    QT_WARNING_POP
}

} // namespace

/// When the message client polls a platform that has no messages.
class MessagePlatformPollTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void cleanup() { pretendedTime().reset(); }

    void firstPollComesInOneToTwoMinutes()
    {
        for (const time_t moment : kMoments) {
            pretendedTime() = moment;
            MessagePlatform platform(nullptr, QStringLiteral("a"), &m_transfer);
            const QTimer* timer = pollTimerOf(platform);
            QVERIFY(timer->isActive() && !timer->isSingleShot());
            QCOMPARE(timer->interval(), intervalNow(120000, 60000));
        }
    }

    void activePollPutsTheNextOffByOneToThreeMinutes()
    {
        const QTimer* timer = pollTimerOf(m_platform);
        for (const time_t moment : kMoments) {
            pretendedTime() = moment;
            QTest::ignoreMessage(QtInfoMsg, "screen state-----: 2");
            m_platform.onUnReadMessages();
            QVERIFY(timer->isActive() && !timer->isSingleShot());
            QCOMPARE(timer->interval(), intervalNow(180000, 60000));
        }
    }

    void intervalIsDrawnWhenThePollIsOver()
    {
        pretendedTime() = kMoments[1];
        const QObject receiver;
        connect(HandleEvent::GetInstance(), &HandleEvent::recvPlatformMsg, &receiver,
                [] { pretendedTime() = kMoments[2]; });
        m_platform.onUnReadMessages();
        pretendedTime() = kMoments[2];
        QCOMPARE(pollTimerOf(m_platform)->interval(), intervalNow(180000, 60000));
    }

    void idleSessionKeepsTheInterval()
    {
        const RecordedService screenSaver(QDBusConnection::SessionBus,
                                          QStringLiteral("com.norix.ScreenSaver"),
                                          answerWith(QVariant::fromValue(QDBusVariant(true))));
        const QTimer* timer = pollTimerOf(m_platform);
        const int before = timer->interval();
        for (const time_t moment : kMoments) {
            pretendedTime() = moment;
            m_platform.onUnReadMessages();
            QVERIFY(timer->isActive());
            QCOMPARE(timer->interval(), before);
        }
    }

    void intervalIsAtLeastTheShortestAndBelowTheLongest()
    {
        for (int max = 60001; max < 180000; max += 37) {
            const int interval = m_platform.generateRandnum(max, 60000);
            QVERIFY2(interval >= 60000 && interval < max, qPrintable(QString::number(interval)));
        }
    }

    void intervalBetweenEqualBoundsIsTheBound() { QCOMPARE(m_platform.generateRandnum(60000, 60000), 60000); }

    void intervalDependsOnTheSecondOfTheDay()
    {
        for (const time_t moment : kMoments) {
            pretendedTime() = moment;
            QCOMPARE(m_platform.generateRandnum(99999, 7), intervalNow(99999, 7));
        }
    }

    void pollTimerOutlivesTheClientAndPollsNoMore()
    {
        auto platform = std::make_unique<MessagePlatform>(nullptr, QStringLiteral("a"), &m_transfer);
        const QPointer<QTimer> timer = pollTimerOf(*platform);
        QVERIFY(timer->parent() == nullptr);
        platform.reset();
        QVERIFY(!timer.isNull());
        timer->start(0);
        const LogRecorder log;
        QVERIFY(QSignalSpy(timer, &QTimer::timeout).wait());
        QCOMPARE(log.lines(), QStringList());
        timer->stop();
    }

private:
    PlatformServer m_server;
    MessageTransfer m_transfer;
    MessagePlatform m_platform{nullptr, QStringLiteral("zhang.wei"), &m_transfer};
};

QTEST_GUILESS_MAIN(MessagePlatformPollTest)
#include "message_platform_poll_test.moc"
