#include <QJsonDocument>
#include <QJsonObject>
#include <QtTest>

#include "filecontent.h"
#include "files.h"
#include "information_files.h"
#include "log_recorder.h"

using velk::base::FileContent;
using velk::base::UserInfo;

namespace {

/// Text of all values of a record, in the order of its fields.
QStringList fields(const UserInfo& info)
{
    return {info.isDomain ? QStringLiteral("true") : QStringLiteral("false"),
            info.serverPort,
            info.serverHost,
            info.domainHost,
            info.domainPort,
            info.terminalName};
}

QStringList list(std::initializer_list<const char*> texts)
{
    QStringList result;
    for (const char* text : texts) {
        result << QString::fromLatin1(text);
    }
    return result;
}

const QByteArray kWhole = R"({"is_Domain":true,"server_port":"1","server_host":"s","domain_host":"d",)"
                          R"("domain_port":"2","terminal_name":"t"})";
const QByteArray kOlder = R"({"is_Domain":true,"server_port":"1","server_host":"s","server_ip":"10.0.0.1",)"
                          R"("terminal_name":"t","other":[1]})";

} // namespace

/// The user information as one record, and what becomes of a file that an older daemon wrote.
class FileContentUserInfoTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init() { removeAny(kUserInfo); }

    void emptyRecordIsFalseAndEmpty() { QCOMPARE(fields(UserInfo()), list({"false", "", "", "", "", ""})); }

    void portStandsBeforeHost()
    {
        const auto text = [](const char* value) { return QString::fromLatin1(value); };
        const UserInfo info{true, text("port"), text("host"), text("dhost"), text("dport"), text("name")};
        QCOMPARE(fields(info), list({"true", "port", "host", "dhost", "dport", "name"}));
        QCOMPARE(info.serverPort, text("port"));
    }

    void wholeRecordIsRead()
    {
        writeBytes(kUserInfo, kWhole);
        const LogRecorder log;
        bool ok = false;
        QCOMPARE(fields(FileContent::getUserInfo(&ok)), list({"true", "1", "s", "d", "2", "t"}));
        QVERIFY(ok);
        QCOMPARE(log.lines(), QStringList());
        QCOMPARE(readBytes(kUserInfo), kWhole);
    }

    void resultFlagDependsOnThreeKeys_data()
    {
        QTest::addColumn<QStringList>("without");
        QTest::addColumn<bool>("ok");

        QTest::newRow("whole") << QStringList() << true;
        QTest::newRow("no is_Domain") << list({"is_Domain"}) << true;
        QTest::newRow("no server_host") << list({"server_host"}) << true;
        QTest::newRow("no domain_host") << list({"domain_host"}) << true;
        QTest::newRow("none of these") << list({"is_Domain", "server_host", "domain_host"}) << true;
        QTest::newRow("migrated domain_port") << list({"domain_port"}) << true;
        QTest::newRow("no port") << list({"domain_port", "server_port"}) << false;
        QTest::newRow("no server_port") << list({"server_port"}) << false;
        QTest::newRow("no terminal_name") << list({"terminal_name"}) << false;
        QTest::newRow("migrated, no terminal_name") << list({"domain_port", "terminal_name"}) << false;
    }

    void resultFlagDependsOnThreeKeys()
    {
        QFETCH(QStringList, without);
        QFETCH(bool, ok);
        QJsonObject object = QJsonDocument::fromJson(kWhole).object();
        for (const QString& key : without) {
            object.remove(key);
        }
        writeBytes(kUserInfo, QJsonDocument(object).toJson());
        const LogRecorder log;
        bool found = !ok;
        FileContent::getUserInfo(&found);
        QCOMPARE(found, ok);
    }

    void missingKeysAreLoggedInOrder()
    {
        writeBytes(kUserInfo, "[]");
        const LogRecorder log;
        bool ok = true;
        QCOMPARE(fields(FileContent::getUserInfo(&ok)), fields(UserInfo()));
        QVERIFY(!ok);

        QStringList expected;
        for (const char* key : {"is_Domain", "server_host", "domain_host", "server_ip", "domain_port",
                                "server_port", "server_port", "terminal_name"}) {
            expected << missingKey("getUserInfo", key);
        }
        QCOMPARE(log.lines(), expected);
        QCOMPARE(readBytes(kUserInfo), QByteArray("[]"));
    }

    void olderFileIsMigratedInPlace()
    {
        writeBytes(kUserInfo, kOlder);
        const LogRecorder log;
        bool ok = false;
        QCOMPARE(fields(FileContent::getUserInfo(&ok)), list({"true", "1", "s", "10.0.0.1", "1", "t"}));
        QVERIFY(ok);
        const QByteArray expected = R"({
    "domain_host": "10.0.0.1",
    "domain_port": "1",
    "is_Domain": true,
    "other": [
        1
    ],
    "server_host": "s",
    "server_ip": "10.0.0.1",
    "server_port": "1",
    "terminal_name": "t"
}
)";
        QCOMPARE(readBytes(kUserInfo), expected);
    }

    void migrationIsLogged()
    {
        writeBytes(kUserInfo, kOlder);
        const LogRecorder log;
        FileContent::getUserInfo(nullptr);
        const QStringList expected{missingKey("getUserInfo", "domain_host"),
                                   missingKey("getUserInfo", "domain_port")};
        QCOMPARE(log.lines(), expected);
    }

    void secondReadFindsTheMigratedFile()
    {
        writeBytes(kUserInfo, kOlder);
        QStringList first;
        {
            const LogRecorder log;
            first = fields(FileContent::getUserInfo(nullptr));
        }
        const QByteArray migrated = readBytes(kUserInfo);
        const LogRecorder log;
        QCOMPARE(fields(FileContent::getUserInfo(nullptr)), first);
        QCOMPARE(log.lines(), QStringList());
        QCOMPARE(readBytes(kUserInfo), migrated);
    }

    void todaysKeysGoBeforeOlderOnes()
    {
        const QByteArray both =
            R"({"is_Domain":false,"server_port":"1","server_host":"s","server_ip":"10.0.0.1",)"
            R"("domain_host":"","domain_port":"","terminal_name":"t"})";
        writeBytes(kUserInfo, both);
        const LogRecorder log;
        // An empty text is a value too.
        QCOMPARE(fields(FileContent::getUserInfo(nullptr)), list({"false", "1", "s", "", "", "t"}));
        QCOMPARE(readBytes(kUserInfo), both);
    }

    void hostAloneIsMigrated()
    {
        writeBytes(kUserInfo, R"({"server_ip":17})");
        const LogRecorder log;
        bool ok = true;
        QCOMPARE(FileContent::getUserInfo(&ok).domainHost, QStringLiteral("17"));
        QVERIFY(!ok);
        QCOMPARE(readBytes(kUserInfo),
                 QByteArray("{\n    \"domain_host\": \"17\",\n    \"server_ip\": 17\n}\n"));
    }

    void failedMigrationOfHostDoesNotCount()
    {
        QByteArray content = kWhole;
        content.replace("domain_host", "server_ip");
        writeBytes(kUserInfo, content);
        setPermissions(kUserInfo, QFile::ReadOwner);
        const LogRecorder log;
        bool ok = false;
        QCOMPARE(FileContent::getUserInfo(&ok).domainHost, QStringLiteral("d"));
        QVERIFY(ok);
        const QStringList expected{missingKey("getUserInfo", "domain_host"),
                                   openFailure(kUserInfo, QStringLiteral("Truncate|WriteOnly"), true),
                                   operationFailure("updateUserInfo")};
        QCOMPARE(log.lines(), expected);
        QCOMPARE(readBytes(kUserInfo), content);
    }

    void failedMigrationOfPortCounts()
    {
        QByteArray content = kWhole;
        content.replace(R"("domain_port":"2",)", "");
        writeBytes(kUserInfo, content);
        setPermissions(kUserInfo, QFile::ReadOwner);
        const LogRecorder log;
        bool ok = true;
        QCOMPARE(fields(FileContent::getUserInfo(&ok)), list({"true", "1", "s", "d", "1", "t"}));
        QVERIFY(!ok);
        QCOMPARE(readBytes(kUserInfo), content);
    }

    void unopenableFileCountsAsRead_data()
    {
        QTest::addColumn<bool>("exists");
        QTest::newRow("missing") << false;
        QTest::newRow("unreadable") << true;
    }

    void unopenableFileCountsAsRead()
    {
        QFETCH(bool, exists);
        if (exists) {
            writeBytes(kUserInfo, kOlder);
            setPermissions(kUserInfo, kNoAccess);
        }
        const LogRecorder log;
        bool ok = false;
        QCOMPARE(fields(FileContent::getUserInfo(&ok)), fields(UserInfo()));
        QVERIFY(ok);
        const QStringList expected{openFailure(kUserInfo, kReadMode, exists),
                                   operationFailure("getUserInfo")};
        QCOMPARE(log.lines(), expected);
    }

    void resultFlagMayBeNull()
    {
        const LogRecorder log;
        QCOMPARE(fields(FileContent::getUserInfo(nullptr)), fields(UserInfo()));
        writeBytes(kUserInfo, "{}");
        QCOMPARE(fields(FileContent::getUserInfo(nullptr)), fields(UserInfo()));
    }
};

QTEST_GUILESS_MAIN(FileContentUserInfoTest)
#include "filecontent_user_info_test.moc"
