#include <QDBusArgument>
#include <QtTest>

#include "handleevent.h"
#include "log_recorder.h"
#include "recorded_service.h"

namespace {

const QString kService = QStringLiteral("com.norix.kpx.Notification");

void sendPlainly(int timeout)
{
    HandleEvent::GetInstance()->sendMessage(QStringLiteral("提醒"), QStringLiteral("body"), timeout);
}

void sendReboot()
{
    HandleEvent::GetInstance()->sendMessage(QStringLiteral("reboot"), QStringLiteral("提醒"),
                                            QStringLiteral("text"), QString(), QString(),
                                            static_cast<uint>(-1));
}

} // namespace

/// What callers may ask for that the agent itself does not, and what is logged of the notification service's
/// answers. End-to-end tests compare whole notifications.
class HandleEventNotificationTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void plainNotificationHasTheGivenTimeout()
    {
        const RecordedService service(QDBusConnection::SessionBus, kService, answerWith(7U));
        sendPlainly(5000);
        QCOMPARE(service.calls().size(), 1);
        QCOMPARE(service.calls().constFirst().arguments().value(7), QVariant(5000));
    }

    void valuesOfAnyOtherTypeThanRebootAreJoinedAsTheyAre()
    {
        const RecordedService service(QDBusConnection::SessionBus, kService, answerWith(7U));
        HandleEvent::GetInstance()->sendMessage(QStringLiteral("Reboot"), QStringLiteral("a,%5"),
                                                QStringLiteral("%1\n\"\U0001F600\""), QString(),
                                                QStringLiteral("%%2"), 0);
        QCOMPARE(service.calls().size(), 1);
        const QVariantList arguments = service.calls().constFirst().arguments();
        QCOMPARE(arguments.value(5).toStringList(),
                 QStringList({QStringLiteral("_open"), QStringLiteral("查看")}));
        QCOMPARE(qdbus_cast<QVariantMap>(arguments.value(6)),
                 (QVariantMap{{QStringLiteral("x-norix-action-_open"),
                               QStringLiteral("Reboot,a,%5,%1\n\"😀\",,%%2")}}));
    }

    void notificationWithActionIsLoggedWithIdAndError_data()
    {
        QTest::addColumn<RecordedService::Answer>("answer");
        QTest::addColumn<QString>("id");
        QTest::addColumn<QString>("error");
        const QString name = QStringLiteral("com.norix.Error");
        QTest::newRow("shown") << answerWith(7U) << QStringLiteral("7") << QStringLiteral(R"("", "")");
        QTest::newRow("answer without an id")
            << answerWith(QStringLiteral("no id")) << QStringLiteral("0") << QStringLiteral(R"("", "")");
        QTest::newRow("failed") << answerError(name, QStringLiteral("no room")) << QStringLiteral("0")
                                << QStringLiteral(R"("com.norix.Error", "no room")");
    }

    void notificationWithActionIsLoggedWithIdAndError()
    {
        QFETCH(RecordedService::Answer, answer);
        QFETCH(QString, id);
        QFETCH(QString, error);
        const RecordedService service(QDBusConnection::SessionBus, kService, answer);
        const LogRecorder log;
        sendReboot();
        QCOMPARE(log.lines(),
                 QStringList({QStringLiteral(R"(info: ----HandleEvent::sendMessage---- "reboot" "提醒")"),
                              QStringLiteral(R"(info: ----HandleEvent::sendMessage---- %1 "reboot")").arg(id),
                              QStringLiteral("info: --@@@@-- QDBusError(%1)").arg(error)}));
        QCOMPARE(service.calls().size(), 1);
    }

    void failedPlainNotificationIsOneWarningAndNotRepeated()
    {
        const RecordedService service(
            QDBusConnection::SessionBus, kService,
            answerError(QStringLiteral("com.norix.Error"), QStringLiteral("no room")));
        const LogRecorder log;
        sendPlainly(0);
        QCOMPARE(
            log.lines(),
            QStringList(QStringLiteral(R"(warning: --@@@@-- QDBusError("com.norix.Error", "no room"))")));
        QCOMPARE(service.calls().size(), 1);
    }

    void absentServiceIsLogged()
    {
        const LogRecorder log;
        sendPlainly(0);
        QCOMPARE(log.warnings().size(), 1);
        QVERIFY(log.warnings().constFirst().startsWith(
            QLatin1String(R"(--@@@@-- QDBusError("org.freedesktop.DBus.Error.ServiceUnknown")")));
    }
};

QTEST_GUILESS_MAIN(HandleEventNotificationTest)
#include "handleevent_notification_test.moc"
