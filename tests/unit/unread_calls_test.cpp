#include <QTest>

#include "bus_client.h"
#include "recorded_service.h"
#include "velkg_interface.h"

namespace {

const QString service = QStringLiteral("com.norix.velk.velkg");
const QString path = QStringLiteral("/com/norix/velk/velkg");

constexpr int kAskedFor = 64;
constexpr int kLongestAskedFor = 65536;
constexpr int kMany = 1000;

} // namespace

/// Many calls to a service that is slow to answer them.
class UnreadCallsTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void everyUnansweredCallArrivesInOrderAndOnlyTheFirstOnesAskForAReply()
    {
        const RecordedService daemon(QDBusConnection::SystemBus, service, neverAnswer);
        velkgInterface proxy(service, path, QDBusConnection::systemBus());

        for (int number = 0; number < kMany; ++number) {
            proxy.sendAppOpenState(number, QStringLiteral("应用"));
        }

        QTRY_COMPARE(daemon.calls().size(), kMany);
        const auto calls = daemon.calls();
        for (int number = 0; number < kMany; ++number) {
            QCOMPARE(calls.at(number).arguments(), (QVariantList{number, QStringLiteral("应用")}));
            QCOMPARE(calls.at(number).isReplyRequired(), number < kAskedFor);
        }
    }

    void longTextIsSentWithoutAskingForAReply()
    {
        const RecordedService daemon(QDBusConnection::SystemBus, service, neverAnswer);
        velkgInterface proxy(service, path, QDBusConnection::systemBus());
        const QString url(8, QLatin1Char('u'));

        for (const int length : {kLongestAskedFor, kLongestAskedFor + 1, url.size()}) {
            proxy.onUploadFinished(url, QString(length - url.size(), QLatin1Char('x')));
        }

        QTRY_COMPARE(daemon.calls().size(), 3);
        QVERIFY(daemon.calls().at(0).isReplyRequired());
        QVERIFY(!daemon.calls().at(1).isReplyRequired());
        QVERIFY(daemon.calls().at(2).isReplyRequired());
    }

    void answeredCallsMakeRoomForOthersThatAsk_data()
    {
        QTest::addColumn<RecordedService::Answer>("answer");
        QTest::newRow("all are answered") << RecordedService::Answer(answerNothing);
        QTest::newRow("the first one hangs") << RecordedService::Answer([](const QDBusMessage& call) {
            return call.arguments().constFirst() == 0 ? QDBusMessage() : call.createReply();
        });
    }

    void answeredCallsMakeRoomForOthersThatAsk()
    {
        QFETCH(RecordedService::Answer, answer);
        const RecordedService daemon(QDBusConnection::SystemBus, service, answer);
        velkgInterface proxy(service, path, QDBusConnection::systemBus());
        proxy.sendAppOpenState(0, QString());
        for (int number = 1; number < 3 * kAskedFor; ++number) {
            QVERIFY(finished(proxy.sendAppOpenState(number, QString())));
        }
        QTRY_COMPARE(daemon.calls().size(), 3 * kAskedFor);
        for (const QDBusMessage& call : daemon.calls()) {
            QVERIFY(call.isReplyRequired());
        }
    }

    void callWithoutAReplyCountsAsFinished()
    {
        const RecordedService daemon(QDBusConnection::SystemBus, service, neverAnswer);
        velkgInterface proxy(service, path, QDBusConnection::systemBus());
        for (int number = 0; number < kAskedFor; ++number) {
            QVERIFY(!proxy.onUploadFinished(QString(), QString()).isFinished());
        }
        const QDBusPendingReply<> reply = proxy.onUploadFinished(QString(), QString());
        QVERIFY(reply.isFinished());
        QVERIFY(!reply.isError());
    }
};

QTEST_GUILESS_MAIN(UnreadCallsTest)
#include "unread_calls_test.moc"
