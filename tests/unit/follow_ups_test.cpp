#include <QtTest>

#include <memory>

#include "follow_ups.h"
#include "manual_clock.h"

namespace {

constexpr int kAtFullSpeed = 1000;
constexpr int kMostInASecond = 50;

} // namespace

/// How a platform is asked that counts further messages with so many of its replies.
class FollowUpsTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_asked = 0;
        m_times.clear();
        m_timer.start();
        m_followUps = std::make_unique<FollowUps>(
            [this] {
                ++m_asked;
                m_times.append(m_timer.nsecsElapsed());
                answer();
            },
            nullptr);
    }

    void backlogOfAThousandIsDrainedAtFullSpeed()
    {
        m_unread = kAtFullSpeed + 1;
        poll();
        settle();
        QCOMPARE(m_asked, kAtFullSpeed);
        moveClock(10);
        QCOMPARE(m_asked, kAtFullSpeed);
    }

    void platformWhoseCountNeverFallsIsAskedFiftyTimesInASecond()
    {
        m_unread = 1'000'000;
        poll();
        settle();
        QCOMPARE(m_asked, kAtFullSpeed);
        for (int second = 0; second < 20; ++second) {
            const int before = m_asked;
            for (int quarter = 0; quarter < 4; ++quarter) {
                moveClock(0.25);
            }
            QVERIFY(m_asked > before);
        }
        const int asked = kMostInASecond - 1; // a poll may come besides
        for (int first = kAtFullSpeed; first + asked < m_asked; ++first) {
            QVERIFY(m_times.at(first + asked) - m_times.at(first) >= 1'000'000'000);
        }
    }

    void longerBacklogIsDrainedToItsEnd()
    {
        m_unread = 1201;
        poll();
        settle();
        for (int second = 0; second < 5; ++second) {
            moveClock(1);
        }
        QCOMPARE(m_asked, 1200);
        QCOMPARE(m_unread, 0);
    }

    void pollDuringThePauseIsNotFollowedUpBeforeItsEnd()
    {
        m_unread = 1'000'000;
        poll();
        settle();
        poll();
        settle();
        QCOMPARE(m_asked, kAtFullSpeed);
        moveClock(1);
        QVERIFY(m_asked > kAtFullSpeed);
    }

    void replyDuringThePauseIsNotFollowedUpBeforeItsEnd()
    {
        m_unread = 1'000'000;
        poll();
        settle();
        answer();
        settle();
        QCOMPARE(m_asked, kAtFullSpeed);
    }

    void drainEndsWhenTheCountHasFallen()
    {
        for (int round = 1; round <= 3; ++round) {
            m_unread = 800;
            poll();
            settle();
            QCOMPARE(m_asked, round * 799);
        }
    }

private:
    /// Handles all that is due by now.
    static void settle()
    {
        const int moreThanBatches = 2 * kAtFullSpeed / kMostInASecond;
        for (int turn = 0; turn < moreThanBatches; ++turn) {
            QCoreApplication::processEvents();
        }
    }

    void moveClock(double seconds)
    {
        m_clock += seconds;
        setClockAhead(m_clock);
        settle();
    }

    void answer() { m_followUps->count(m_unread--); }

    void poll()
    {
        m_followUps->after([this] { answer(); });
    }

    std::unique_ptr<FollowUps> m_followUps;
    int m_unread = 0; ///< the platform's count before the next reply
    int m_asked = 0; ///< follow-ups since the start of the test
    QVector<qint64> m_times; ///< of these, by the clock, in nanoseconds
    QElapsedTimer m_timer;
    double m_clock = 0;
};

QTEST_GUILESS_MAIN(FollowUpsTest)
#include "follow_ups_test.moc"
