#include <QDBusVariant>
#include <QSemaphore>
#include <QtTest>

#include <atomic>

#include "recorded_service.h"
#include "remote_object.h"

namespace {

QString serviceName()
{
    return QStringLiteral("com.norix.Test");
}

RemoteObject testObject()
{
    return {QDBusConnection::sessionBus(), serviceName(), QStringLiteral("/com/norix/Test"),
            QStringLiteral("com.norix.Test.Interface")};
}

QDBusMessage answerWithNameOfProperty(const QDBusMessage& call)
{
    return call.createReply(QVariant::fromValue(QDBusVariant(call.arguments().at(1))));
}

} // namespace

/// Each test has one service on the session bus, and answers for it.
class RemoteObjectTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void absentServiceReadsAsNothing()
    {
        QVERIFY(!testObject().propertyIfPresent(QStringLiteral("Any")).has_value());
        QVERIFY(!testObject().property(QStringLiteral("Any")).isValid());
    }

    void presentServiceThatDoesNotAnswerProperlyReadsAsInvalid_data()
    {
        QTest::addColumn<RecordedService::Answer>("answer");
        const QString unknown = QDBusError::errorString(QDBusError::UnknownProperty);
        QTest::newRow("error") << answerError(unknown, QStringLiteral("no such property"));
        QTest::newRow("reply of another type") << answerWith(QStringLiteral("bare"));
    }

    void presentServiceThatDoesNotAnswerProperlyReadsAsInvalid()
    {
        QFETCH(RecordedService::Answer, answer);
        const RecordedService service(QDBusConnection::SessionBus, serviceName(), answer);
        QVERIFY(!testObject().property(QStringLiteral("Any")).isValid());
        QCOMPARE(testObject().propertyIfPresent(QStringLiteral("Any")), std::optional(QVariant()));
    }

    void propertyIsReadByOneStandardCall()
    {
        const RecordedService service(QDBusConnection::SessionBus, serviceName(), answerWithNameOfProperty);
        QCOMPARE(testObject().property(QStringLiteral("Color")), QVariant(QStringLiteral("Color")));

        QCOMPARE(service.calls().size(), 1);
        const QDBusMessage call = service.calls().constFirst();
        QCOMPARE(call.path(), QStringLiteral("/com/norix/Test"));
        QCOMPARE(call.interface(), QStringLiteral("org.freedesktop.DBus.Properties"));
        QCOMPARE(call.member(), QStringLiteral("Get"));
        QCOMPARE(call.arguments(),
                 QVariantList({QStringLiteral("com.norix.Test.Interface"), QStringLiteral("Color")}));
    }

    void severalPropertiesComeInTheOrderOfTheirNames()
    {
        const RecordedService service(QDBusConnection::SessionBus, serviceName(), answerWithNameOfProperty);
        const QStringList names{QStringLiteral("b"), QStringLiteral("a"), QStringLiteral("c")};
        QCOMPARE(testObject().properties(names), QVariantList({names.at(0), names.at(1), names.at(2)}));
    }

    void valueOfAnotherTypeIsHandedOn()
    {
        const RecordedService service(
            QDBusConnection::SessionBus, serviceName(),
            answerWith(QVariant::fromValue(QDBusVariant(QStringList{QStringLiteral("a list")}))));
        const QVariant value = testObject().property(QStringLiteral("Any"));
        QVERIFY(value.isValid());
        QVERIFY(!value.toBool());
    }

    void propertyIsWrittenByOneStandardCall()
    {
        const RecordedService service(QDBusConnection::SessionBus, serviceName(), answerNothing);
        testObject().setProperty(QStringLiteral("Enable"), false);
        QTRY_COMPARE(service.calls().size(), 1);
        const QDBusMessage call = service.calls().constFirst();
        QCOMPARE(call.interface(), QStringLiteral("org.freedesktop.DBus.Properties"));
        QCOMPARE(call.member(), QStringLiteral("Set"));
        QCOMPARE(call.signature(), QStringLiteral("ssv"));
        QCOMPARE(call.arguments().mid(0, 2),
                 QVariantList({QStringLiteral("com.norix.Test.Interface"), QStringLiteral("Enable")}));
        QCOMPARE(call.arguments().at(2).value<QDBusVariant>().variant(), QVariant(false));
    }

    void writingDoesNotWaitForTheReply()
    {
        QSemaphore written;
        QSemaphore answered;
        std::atomic_bool answeredAfterWriting = false;
        const RecordedService service(QDBusConnection::SessionBus, serviceName(),
                                      [&](const QDBusMessage& call) {
                                          answeredAfterWriting = written.tryAcquire(1, 10000);
                                          answered.release();
                                          return call.createReply();
                                      });
        testObject().setProperty(QStringLiteral("Enable"), false);
        written.release();
        answered.acquire();
        QVERIFY(answeredAfterWriting);
    }

    void unconnectedBusIsHarmless()
    {
        const RemoteObject object(QDBusConnection(QStringLiteral("never connected")), serviceName(),
                                  QStringLiteral("/"), serviceName());
        QVERIFY(!object.propertyIfPresent(QStringLiteral("Any")).has_value());
        QVERIFY(!object.property(QStringLiteral("Any")).isValid());
        object.setProperty(QStringLiteral("Any"), true);
    }
};

QTEST_GUILESS_MAIN(RemoteObjectTest)
#include "remote_object_test.moc"
