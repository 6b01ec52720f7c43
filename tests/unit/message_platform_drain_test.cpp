#include <QTimer>
#include <QtTest>

#include <functional>
#include <memory>

#include "handleevent.h"
#include "message_platform.h"
#include "message_transfer.h"
#include "platform_files.h"

using Waiting = void (*)(QObject*, const std::function<void()>&);
Q_DECLARE_METATYPE(Waiting)

/// How the client asks for one message after the other, of a platform whose replies count further ones.
class MessagePlatformDrainTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_platform = std::make_unique<MessagePlatform>(nullptr, QStringLiteral("zhang.wei"), &m_transfer);
        m_replies = 0;
        m_countingReplies = 0;
        m_afterReply = nullptr;
        m_server.forgetRequests();
        // Adds a count to the replies, while the client waits for them.
        connect(HandleEvent::GetInstance(), &HandleEvent::recvPlatformMsg, m_platform.get(), [this] {
            if (++m_replies <= m_countingReplies) {
                m_platform->OnRecvMsg(200, QString(), {{"X-Total-Count", "2"}});
            }
            if (m_afterReply) {
                m_afterReply();
            }
        });
    }

    void cleanup() { m_platform.reset(); }

    void followUpIsAskedForBeforeTheListReturns()
    {
        m_countingReplies = 1;
        m_afterReply = [this] { m_platform->messageRespond(QStringLiteral("marker")); };
        m_platform->unreadMessages(QStringLiteral("first"), 1, 1);
        QVERIFY(m_server.nextTarget().startsWith(
            QLatin1String("/notification/v2/list?uid=first&is_not_read=1&limit=1&offset=0&")));
        // The reply is handled to its end first.
        QVERIFY(m_server.nextTarget().startsWith(QLatin1String("/notification/v2/read")));
        QVERIFY(m_server.nextTarget().startsWith(
            QLatin1String("/notification/v2/list?uid=zhang.wei&is_not_read=1&limit=1&offset=0&")));
    }

    void replyOnItsOwnAsksForTheNextAtOnce()
    {
        m_platform->OnRecvMsg(200, QString(), {{"X-Total-Count", "2"}});
        QCOMPARE(m_replies, 1);
        QVERIFY(m_server.nextTarget().startsWith(
            QLatin1String("/notification/v2/list?uid=zhang.wei&is_not_read=1&limit=1&offset=0&")));
    }

    void fiftyFollowUpsAreAskedForBeforeTheListReturns()
    {
        m_countingReplies = 120;
        m_platform->unreadMessages(QStringLiteral("first"), 1, 1);
        QCOMPARE(m_replies, 51);
        QTRY_COMPARE(m_replies, 121);
    }

    void whatWaitsHasItsTurnAfterEveryFiftyFollowUps_data()
    {
        QTest::addColumn<Waiting>("wait");
        const Waiting asEvent = [](QObject* context, const std::function<void()>& turn) {
            QMetaObject::invokeMethod(context, turn, Qt::QueuedConnection);
        };
        const Waiting asTimer = [](QObject* context, const std::function<void()>& turn) {
            auto* timer = new QTimer(context);
            timer->setSingleShot(true);
            connect(timer, &QTimer::timeout, context, turn);
            timer->start(0);
        };
        QTest::newRow("event") << asEvent;
        QTest::newRow("timer") << asTimer;
    }

    void whatWaitsHasItsTurnAfterEveryFiftyFollowUps()
    {
        QFETCH(Waiting, wait);
        QList<int> turns;
        m_countingReplies = 160;
        m_afterReply = [this, wait, &turns] {
            if (m_replies == 10 || m_replies == 60 || m_replies == 110) {
                wait(m_platform.get(), [this, &turns] { turns << m_replies; });
            }
        };
        m_platform->unreadMessages(QStringLiteral("first"), 1, 1);
        QTRY_COMPARE(m_replies, 161);
        const QList<int> expected{51, 101, 151};
        QCOMPARE(turns, expected);
    }

    void listDuringADrainLeavesTheFollowUpsToIt()
    {
        m_countingReplies = 120;
        m_platform->unreadMessages(QStringLiteral("first"), 1, 1);
        m_platform->unreadMessages(QStringLiteral("second"), 1, 1);
        QCOMPARE(m_replies, 52);
        QTRY_COMPARE(m_replies, 121);
    }

    void replyOnItsOwnDuringADrainStartsNoSecondOne()
    {
        m_countingReplies = 260;
        m_platform->unreadMessages(QStringLiteral("first"), 1, 1);
        m_platform->OnRecvMsg(200, QString(), {{"X-Total-Count", "2"}});
        QCOMPARE(m_replies, 51);

        int turn = 0;
        m_afterReply = [this, &turn] {
            if (m_replies == 52) {
                QTimer::singleShot(0, m_platform.get(), [this, &turn] { turn = m_replies; });
            }
        };
        QTRY_COMPARE(m_replies, 261);
        QCOMPARE(turn, 101);
    }

    void listAfterADrainIsFollowedUpAtOnceAgain()
    {
        m_countingReplies = 60;
        m_platform->unreadMessages(QStringLiteral("first"), 1, 1);
        QTRY_COMPARE(m_replies, 61);
        m_countingReplies = 62;
        m_platform->unreadMessages(QStringLiteral("second"), 1, 1);
        QCOMPARE(m_replies, 63);
    }

    void drainEndsWithTheClient()
    {
        m_countingReplies = 1000;
        m_platform->unreadMessages(QStringLiteral("first"), 1, 1);
        m_platform.reset();
        QCoreApplication::processEvents();
        QCOMPARE(m_replies, 51);
    }

private:
    PlatformServer m_server;
    MessageTransfer m_transfer;
    std::unique_ptr<MessagePlatform> m_platform;
    int m_replies = 0; ///< since the start of the test
    int m_countingReplies = 0; ///< that many of them, the first ones, count a further message
    std::function<void()> m_afterReply;
};

QTEST_GUILESS_MAIN(MessagePlatformDrainTest)
#include "message_platform_drain_test.moc"
