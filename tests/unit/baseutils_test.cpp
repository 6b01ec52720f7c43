#include <QJsonArray>
#include <QJsonObject>
#include <QtTest>

#include "baseutils.h"
#include "log_recorder.h"

using velk::base::BaseUtils;

namespace {

const QString kKey = QStringLiteral("key");
const QString kOperation = QStringLiteral("readIt");

} // namespace

class BaseUtilsTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void failedOpenIsLoggedWithItsOperation()
    {
        const LogRecorder log;
        BaseUtils::openFailedLog(kOperation);
        QCOMPARE(log.lines(), QStringList(QStringLiteral(R"(warning: "readIt" open file failed!)")));
    }

    void missingKeyIsLoggedAndLeavesValue()
    {
        const LogRecorder log;
        bool flag = true;
        QString text = QStringLiteral("before");
        QVERIFY(!BaseUtils::getJsonObjectValue({}, kKey, flag, kOperation));
        QVERIFY(!BaseUtils::getJsonObjectValue({}, kKey, text, kOperation));
        QCOMPARE(flag, true);
        QCOMPARE(text, QStringLiteral("before"));

        const QString line = QStringLiteral(R"(warning: "readIt" can not get json key: "key")");
        const QStringList expected{line, line};
        QCOMPARE(log.lines(), expected);
    }

    void keyDependsOnLetterCase()
    {
        const LogRecorder log;
        bool flag = false;
        QVERIFY(!BaseUtils::getJsonObjectValue({{QStringLiteral("Key"), true}}, kKey, flag, kOperation));
        QCOMPARE(flag, false);
    }

    void memberIsConvertedToBool_data()
    {
        QTest::addColumn<QJsonValue>("member");
        QTest::addColumn<bool>("before");
        QTest::addColumn<bool>("expected");

        QTest::newRow("true") << QJsonValue(true) << false << true;
        QTest::newRow("false") << QJsonValue(false) << true << false;
        QTest::newRow("zero") << QJsonValue(0) << true << false;
        QTest::newRow("number") << QJsonValue(-2) << false << true;
        QTest::newRow("text") << QJsonValue(QStringLiteral("yes")) << false << true;
        QTest::newRow("text false") << QJsonValue(QStringLiteral("False")) << true << false;
        QTest::newRow("text 0") << QJsonValue(QStringLiteral("0")) << true << false;
        QTest::newRow("empty text") << QJsonValue(QString()) << true << false;
        QTest::newRow("null") << QJsonValue(QJsonValue::Null) << true << false;
        QTest::newRow("array") << QJsonValue(QJsonArray{true}) << true << false;
        QTest::newRow("object") << QJsonValue(QJsonObject{{kKey, true}}) << true << false;
    }

    void memberIsConvertedToBool()
    {
        QFETCH(QJsonValue, member);
        QFETCH(bool, before);
        const LogRecorder log;
        bool value = before;
        QVERIFY(BaseUtils::getJsonObjectValue({{kKey, member}}, kKey, value, kOperation));
        QTEST(value, "expected");
        QCOMPARE(log.lines(), QStringList());
    }

    void memberIsConvertedToString_data()
    {
        QTest::addColumn<QJsonValue>("member");
        QTest::addColumn<QString>("expected");

        QTest::newRow("text") << QJsonValue(QStringLiteral("终端 1")) << QStringLiteral("终端 1");
        QTest::newRow("empty text") << QJsonValue(QString()) << QString();
        QTest::newRow("whole number") << QJsonValue(8443) << QStringLiteral("8443");
        QTest::newRow("number") << QJsonValue(1.5) << QStringLiteral("1.5");
        QTest::newRow("true") << QJsonValue(true) << QStringLiteral("true");
        QTest::newRow("false") << QJsonValue(false) << QStringLiteral("false");
        QTest::newRow("null") << QJsonValue(QJsonValue::Null) << QString();
        QTest::newRow("array") << QJsonValue(QJsonArray{QStringLiteral("a")}) << QString();
        QTest::newRow("object") << QJsonValue(QJsonObject{{kKey, QStringLiteral("a")}}) << QString();
    }

    void memberIsConvertedToString()
    {
        QFETCH(QJsonValue, member);
        const LogRecorder log;
        QString value = QStringLiteral("before");
        QVERIFY(BaseUtils::getJsonObjectValue({{kKey, member}}, kKey, value, kOperation));
        QTEST(value, "expected");
        QCOMPARE(log.lines(), QStringList());
    }
};

QTEST_GUILESS_MAIN(BaseUtilsTest)
#include "baseutils_test.moc"
