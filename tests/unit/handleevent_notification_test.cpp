#include <QDBusArgument>
#include <QtTest>

#include "handleevent.h"
#include "recorded_service.h"

namespace {

QString serviceName()
{
    return QStringLiteral("com.norix.kpx.Notification");
}

/// The arguments of the one call that the service was sent.
QVariantList sentTo(const RecordedService& service)
{
    const auto calls = service.calls();
    return calls.size() == 1 ? calls.constFirst().arguments() : QVariantList();
}

QString actionHint(const QVariantList& arguments)
{
    return qdbus_cast<QVariantMap>(arguments.value(6))
        .value(QStringLiteral("x-norix-action-_open"))
        .toString();
}

void sendReboot()
{
    HandleEvent::GetInstance()->sendMessage(QStringLiteral("reboot"), QStringLiteral("提醒"),
                                            QStringLiteral("text"), QString(), QString(),
                                            static_cast<uint>(-1));
}

using Sender = std::function<void()>;

} // namespace

Q_DECLARE_METATYPE(Sender)

/// What the notification service is sent, and what is logged of its answers.
class HandleEventNotificationTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void everySenderCallsNotifyWithTheSameSignature_data()
    {
        QTest::addColumn<Sender>("send");
        QTest::newRow("plain") << Sender(
            [] { HandleEvent::GetInstance()->sendMessage(QStringLiteral("t"), QStringLiteral("b"), 0); });
        QTest::newRow("with action") << Sender(sendReboot);
        QTest::newRow("password change")
            << Sender([] { HandleEvent::GetInstance()->sendChangePasswdMessage(); });
    }

    void everySenderCallsNotifyWithTheSameSignature()
    {
        QFETCH(Sender, send);
        const RecordedService service(QDBusConnection::SessionBus, serviceName(), answerWith(7U));
        send();
        QCOMPARE(service.calls().size(), 1);
        const QDBusMessage call = service.calls().constFirst();
        QCOMPARE(call.path(), QStringLiteral("/com/norix/kpx/Notification"));
        QCOMPARE(call.interface(), serviceName());
        QCOMPARE(call.member(), QStringLiteral("Notify"));
        QCOMPARE(call.signature(), QStringLiteral("susssasa{sv}i"));
        QCOMPARE(call.arguments().at(1), QVariant(0U));
        QCOMPARE(call.arguments().at(2), QVariant(QStringLiteral("velkw")));
    }

    void plainNotificationHasTitleBodyAndTimeout_data()
    {
        QTest::addColumn<int>("timeout");
        QTest::newRow("the desktop's default") << -1;
        QTest::newRow("never") << 0;
        QTest::newRow("some time") << 5000;
    }

    void plainNotificationHasTitleBodyAndTimeout()
    {
        QFETCH(int, timeout);
        const RecordedService service(QDBusConnection::SessionBus, serviceName(), answerWith(7U));
        HandleEvent::GetInstance()->sendMessage(QStringLiteral("提醒"), QStringLiteral("body"), timeout);
        const QVariantList arguments = sentTo(service);
        QCOMPARE(arguments.value(0), QVariant(QStringLiteral("提醒")));
        QCOMPARE(arguments.value(3), QVariant(QStringLiteral("提醒")));
        QCOMPARE(arguments.value(4), QVariant(QStringLiteral("body")));
        QCOMPARE(arguments.value(5).toStringList(), QStringList());
        QVERIFY(qdbus_cast<QVariantMap>(arguments.value(6)).isEmpty());
        QCOMPARE(arguments.value(7), QVariant(timeout));
    }

    void rebootNotificationOffersReboot()
    {
        const RecordedService service(QDBusConnection::SessionBus, serviceName(), answerWith(7U));
        sendReboot();
        const QVariantList arguments = sentTo(service);
        QCOMPARE(arguments.value(5).toStringList(),
                 QStringList({QStringLiteral("_open"), QStringLiteral("重启")}));
        QCOMPARE(actionHint(arguments), QStringLiteral("reboot"));
        QCOMPARE(qdbus_cast<QVariantMap>(arguments.value(6)).size(), 1);
        QCOMPARE(arguments.value(7), QVariant(-1));
    }

    void messageNotificationCarriesItsFiveValues()
    {
        const RecordedService service(QDBusConnection::SessionBus, serviceName(), answerWith(7U));
        HandleEvent::GetInstance()->sendMessage(QStringLiteral("/usr/bin/velkm"), QStringLiteral("title"),
                                                QStringLiteral("content"), QStringLiteral("sender"),
                                                QStringLiteral("2026-01-02 03:04:05"), 0);
        const QVariantList arguments = sentTo(service);
        QCOMPARE(arguments.value(0), QVariant(QStringLiteral("title")));
        QCOMPARE(arguments.value(3), QVariant(QStringLiteral("title")));
        QCOMPARE(arguments.value(4), QVariant(QStringLiteral("content")));
        QCOMPARE(arguments.value(5).toStringList(),
                 QStringList({QStringLiteral("_open"), QStringLiteral("查看")}));
        QCOMPARE(actionHint(arguments),
                 QStringLiteral("/usr/bin/velkm,title,content,sender,2026-01-02 03:04:05"));
        QCOMPARE(arguments.value(7), QVariant(0));
    }

    void unusualValuesAreJoinedAsTheyAre()
    {
        const RecordedService service(QDBusConnection::SessionBus, serviceName(), answerWith(7U));
        HandleEvent::GetInstance()->sendMessage(QStringLiteral("Reboot"), QStringLiteral("a,%5"),
                                                QStringLiteral("%1\n\"\U0001F600\""), QString(),
                                                QStringLiteral("%%2"), 0);
        QCOMPARE(actionHint(sentTo(service)), QStringLiteral("Reboot,a,%5,%1\n\"😀\",,%%2"));
    }

    void passwordChangeNoticeIsFixed()
    {
        const RecordedService service(QDBusConnection::SessionBus, serviceName(), answerWith(7U));
        HandleEvent::GetInstance()->sendChangePasswdMessage();
        const QVariantList arguments = sentTo(service);
        QCOMPARE(arguments.value(0), QVariant(QStringLiteral("提醒")));
        QCOMPARE(arguments.value(3), QVariant(QStringLiteral("提醒")));
        QCOMPARE(arguments.value(4),
                 QVariant(QStringLiteral("管理员调整密码规则，避免影响登录，请及时修改密码")));
        QCOMPARE(arguments.value(5).toStringList(), QStringList());
        QVERIFY(qdbus_cast<QVariantMap>(arguments.value(6)).isEmpty());
        QCOMPARE(arguments.value(7), QVariant(0));
    }

    void notificationWithActionIsLoggedWithIdAndError()
    {
        const RecordedService service(QDBusConnection::SessionBus, serviceName(), answerWith(7U));
        QTest::ignoreMessage(QtInfoMsg, R"(----HandleEvent::sendMessage---- "reboot" "提醒")");
        QTest::ignoreMessage(QtInfoMsg, R"(----HandleEvent::sendMessage---- 7 "reboot")");
        QTest::ignoreMessage(QtInfoMsg, R"(--@@@@-- QDBusError("", ""))");
        sendReboot();
    }

    void answerWithoutIdIsLoggedAsZero()
    {
        const RecordedService service(QDBusConnection::SessionBus, serviceName(),
                                      answerWith(QStringLiteral("no id")));
        QTest::ignoreMessage(QtInfoMsg, R"(----HandleEvent::sendMessage---- 0 "reboot")");
        sendReboot();
    }

    void failedNotificationIsLoggedAndNotRepeated()
    {
        const RecordedService service(
            QDBusConnection::SessionBus, serviceName(),
            answerError(QStringLiteral("com.norix.Error"), QStringLiteral("no room")));
        QTest::ignoreMessage(QtWarningMsg, R"(--@@@@-- QDBusError("com.norix.Error", "no room"))");
        HandleEvent::GetInstance()->sendMessage(QStringLiteral("t"), QStringLiteral("b"), 0);
        QTest::ignoreMessage(QtInfoMsg, R"(--@@@@-- QDBusError("com.norix.Error", "no room"))");
        sendReboot();
        QCOMPARE(service.calls().size(), 2);
    }

    void absentServiceIsLogged()
    {
        QTest::ignoreMessage(QtWarningMsg,
                             QRegularExpression(QStringLiteral("^--@@@@-- QDBusError\\(.*ServiceUnknown")));
        HandleEvent::GetInstance()->sendChangePasswdMessage();
    }
};

QTEST_GUILESS_MAIN(HandleEventNotificationTest)
#include "handleevent_notification_test.moc"
