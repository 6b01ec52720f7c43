#include <QtTest>

#include <unistd.h>

#include <algorithm>
#include <memory>
#include <optional>

#include "message_transfer.h"
#include "meta_order.h"
#include "recorded_service.h"

namespace {

/// What getuid() answers instead of the program's own uid.
std::optional<uid_t> pretendedUid;

} // namespace

/// Replaces the C library's: the box has one user above and one below the limit, and none at it.
uid_t getuid() noexcept
{
    return pretendedUid.value_or(geteuid());
}

namespace {

QStringList forcedActions(const RecordedService& service)
{
    QStringList actions;
    const auto calls = service.calls();
    for (const QDBusMessage& call : calls) {
        if (call.interface() != QLatin1String("org.freedesktop.DBus.Properties")) {
            actions.append(call.path() + QLatin1Char(' ') + call.interface() + QLatin1Char('.')
                           + call.member());
        }
    }
    return actions;
}

QTimer* timerOf(const MessageTransfer& transfer, bool (*wanted)(const QTimer*))
{
    const auto timers = transfer.findChildren<QTimer*>();
    const auto found = std::find_if(timers.begin(), timers.end(), wanted);
    return found == timers.end() ? nullptr : *found;
}

bool isCountdown(const QTimer* timer)
{
    return timer->isActive() && timer->interval() == 60000;
}

} // namespace

/// Runs as a domain user with a login manager and a notification service that only record.
class MessageTransferTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_logind = std::make_unique<RecordedService>(QDBusConnection::SystemBus,
                                                     QStringLiteral("org.freedesktop.login1"), answerNothing);
        m_notifications = std::make_unique<RecordedService>(
            QDBusConnection::SessionBus, QStringLiteral("com.norix.kpx.Notification"), answerNothing);
    }

    void cleanup()
    {
        pretendedUid.reset();
        m_notifications.reset();
        m_logind.reset();
    }

    void slotsStandInTheirOrder()
    {
        const QStringList expected{QStringLiteral("onPolicyMsg(QString,QString)"),
                                   QStringLiteral("onSoftwareChanged(QString,QStringList)"),
                                   QStringLiteral("onTimeout()"), QStringLiteral("getUserState()")};
        QCOMPARE(methodsInOrder(MessageTransfer::staticMetaObject), expected);
    }

    void userAboveTheLocalRangeIsDomainUser_data()
    {
        QTest::addColumn<uint>("uid");
        QTest::addColumn<bool>("isDomainUser");

        QTest::newRow("root") << 0U << false;
        QTest::newRow("last local") << 10000U << false;
        QTest::newRow("first of the domain") << 10001U << true;
        QTest::newRow("beyond the signed range") << 3000000000U << true;
    }

    void userAboveTheLocalRangeIsDomainUser()
    {
        QFETCH(uint, uid);
        MessageTransfer transfer;
        pretendedUid = uid;
        QTEST(transfer.isLdapUser(), "isDomainUser");
    }

    void accountPolicyNamesUserByUid_data()
    {
        QTest::addColumn<QJsonObject>("message");
        QTest::addColumn<bool>("named");

        const QString payload = QStringLiteral("payload");
        const QString uid = QStringLiteral("uid");
        const auto own = static_cast<qint32>(getuid());
        QTest::newRow("own uid") << QJsonObject{{payload, QJsonObject{{uid, own}}}} << true;
        QTest::newRow("another uid") << QJsonObject{{payload, QJsonObject{{uid, own + 1}}}} << false;
        QTest::newRow("uid as text") << QJsonObject{{payload, QJsonObject{{uid, QString::number(own)}}}}
                                     << false;
        QTest::newRow("fraction") << QJsonObject{{payload, QJsonObject{{uid, own + 0.5}}}} << false;
        QTest::newRow("no uid") << QJsonObject{{payload, QJsonObject()}} << false;
        QTest::newRow("payload is no object") << QJsonObject{{payload, own}} << false;
        QTest::newRow("no payload") << QJsonObject{{uid, own}} << false;
    }

    void accountPolicyNamesUserByUid()
    {
        QFETCH(QJsonObject, message);
        QTEST(MessageTransfer().isExecPolicyByUID(message), "named");
    }

    void accountPolicyCheckIsLogged()
    {
        const auto own = static_cast<qint32>(getuid());
        QJsonObject message{{QStringLiteral("payload"), QJsonObject{{QStringLiteral("uid"), 7}}}};
        const QString line = QStringLiteral("sendUID : 7 , localUID: %1 ,flag : false").arg(own);
        QTest::ignoreMessage(QtDebugMsg, qUtf8Printable(line));
        MessageTransfer().isExecPolicyByUID(message);
    }

    void messageWithoutPayloadNamesNoUserNotEvenRoot()
    {
        // A payload without a uid would be read as uid 0.
        QJsonObject message;
        MessageTransfer transfer;
        pretendedUid = 0;
        QVERIFY(!transfer.isExecPolicyByUID(message));
    }

    void messageWithoutUidNamesRoot()
    {
        QJsonObject message{{QStringLiteral("payload"), QJsonObject()}};
        MessageTransfer transfer;
        pretendedUid = 0;
        QVERIFY(transfer.isExecPolicyByUID(message));
        for (const uid_t other : {1U, static_cast<uid_t>(-1)}) {
            pretendedUid = other;
            QVERIFY(!transfer.isExecPolicyByUID(message));
        }
    }

    void countdownTakesAMinute()
    {
        MessageTransfer transfer;
        QVERIFY(timerOf(transfer, isCountdown) == nullptr);
        transfer.startTime(QString(), 1201);
        QVERIFY(timerOf(transfer, isCountdown) != nullptr);
    }

    void countdownIsNotRounded()
    {
        // By default Qt lets a timer of this length fire half a second early.
        MessageTransfer transfer;
        transfer.startTime(QString(), 1201);
        QCOMPARE(timerOf(transfer, isCountdown)->timerType(), Qt::PreciseTimer);
    }

    void expiredCountdownStops_data()
    {
        QTest::addColumn<int>("code");
        for (const int code : {1200, 1201, 0}) {
            QTest::addRow("%d", code) << code;
        }
    }

    void expiredCountdownStops()
    {
        QFETCH(int, code);
        MessageTransfer transfer;
        transfer.startTime(QString(), code);
        transfer.onTimeout();
        QVERIFY(timerOf(transfer, isCountdown) == nullptr);
    }

    void expiredCountdownForcesActionOfItsCode_data()
    {
        QTest::addColumn<int>("code");
        QTest::addColumn<QString>("action");

        const QString terminate =
            QStringLiteral("/org/freedesktop/login1/session/auto org.freedesktop.login1.Session.Terminate");
        QTest::newRow("domain exit") << 1200
                                     << QStringLiteral(
                                            "/org/freedesktop/login1 org.freedesktop.login1.Manager.Reboot");
        QTest::newRow("terminal disabled") << 1201 << terminate;
        QTest::newRow("account deleted") << 1202 << terminate;
        QTest::newRow("account disabled") << 1203 << terminate;
    }

    void expiredCountdownForcesActionOfItsCode()
    {
        QFETCH(int, code);
        QFETCH(QString, action);
        MessageTransfer transfer;
        transfer.startTime(QString(), code);
        transfer.onTimeout();
        QCOMPARE(forcedActions(*m_logind), QStringList{action});
    }

    void expiredCountdownWithoutForcedActionDoesNothing_data()
    {
        QTest::addColumn<int>("code");
        for (const int code : {0, 1100, 1300, 1304}) {
            QTest::addRow("%d", code) << code;
        }
    }

    void expiredCountdownWithoutForcedActionDoesNothing()
    {
        QFETCH(int, code);
        MessageTransfer transfer;
        transfer.startTime(QString(), code);
        transfer.onTimeout();
        QCOMPARE(forcedActions(*m_logind), QStringList());
    }

    void laterCodeReplacesPendingOne()
    {
        MessageTransfer transfer;
        transfer.rebootTime(QString(), 1200);
        transfer.startTime(QString(), 1201);
        transfer.onTimeout();
        QCOMPARE(forcedActions(*m_logind).size(), 1);
        QVERIFY(forcedActions(*m_logind).constFirst().endsWith(QLatin1String("Session.Terminate")));
    }

    void expiryKeepsThePendingCode()
    {
        MessageTransfer transfer;
        transfer.startTime(QString(), 1201);
        transfer.onTimeout();
        transfer.onTimeout();
        QCOMPARE(forcedActions(*m_logind).size(), 2);
    }

    void stateIsReportedEveryFiveMinutes()
    {
        MessageTransfer transfer;
        QVERIFY(timerOf(transfer,
                        [](const QTimer* timer) {
                            return timer->isActive() && timer->interval() == 300000 && !timer->isSingleShot();
                        })
                != nullptr);
    }

private:
    std::unique_ptr<RecordedService> m_logind;
    std::unique_ptr<RecordedService> m_notifications;
};

QTEST_GUILESS_MAIN(MessageTransferTest)
#include "message_transfer_test.moc"
