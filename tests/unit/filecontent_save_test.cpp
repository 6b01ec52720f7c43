#include <QtTest>

#include "filecontent.h"
#include "files.h"
#include "information_files.h"
#include "log_recorder.h"

using velk::base::FileContent;
using velk::base::updateUserInfo;
using velk::base::UserInfo;

namespace {

bool saveRecord()
{
    return FileContent::saveUserInfo({true, QStringLiteral("1"), QStringLiteral("s"), QStringLiteral("d"),
                                      QStringLiteral("2"), QStringLiteral("终端")});
}

const QByteArray kRecord = R"({
    "domain_host": "d",
    "domain_port": "2",
    "is_Domain": true,
    "server_host": "s",
    "server_port": "1",
    "terminal_name": "终端"
}
)";

const char* const kIsTrue = "{\n    \"is_Domain\": true\n}\n";
const char* const kIsFalse = "{\n    \"is_Domain\": false\n}\n";
const char* const kAmongOthers = R"({
    "is_Domain": false,
    "server_ip": "",
    "z": {
        "a": [
            1,
            "终"
        ]
    }
}
)";

} // namespace

/// What the operations that write leave in the file, byte for byte.
class FileContentSaveTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init() { removeAny(kUserInfo); }

    void domainMembershipIsSaved_data()
    {
        QTest::addColumn<QByteArray>("before");
        QTest::addColumn<bool>("value");
        QTest::addColumn<bool>("result");
        QTest::addColumn<QByteArray>("after");
        QTest::addColumn<QString>("line");

        const auto changed = [](const char* name, const char* before, bool value, const char* after) {
            QTest::newRow(name) << QByteArray(before) << value << true << QByteArray(after) << QString();
        };
        const auto same = [](const char* name, const char* before, bool value) {
            QTest::newRow(name) << QByteArray(before) << value << true << QByteArray(before)
                                << QStringLiteral(R"(debug: value is the same in file, key: "is_Domain")");
        };
        const auto refused = [](const char* name, const char* before) {
            QTest::newRow(name) << QByteArray(before) << true << false << QByteArray(before)
                                << QStringLiteral(
                                       R"(info: It is not contain in info file, key: "is_Domain")");
        };

        changed("to true", R"({"is_Domain":false})", true, kIsTrue);
        changed("to false", R"({"is_Domain":true})", false, kIsFalse);
        changed("text is no true", R"({"is_Domain":"true"})", true, kIsTrue);
        changed("number is no true", R"({"is_Domain":1})", true, kIsTrue);
        changed("byte order mark goes", "\xef\xbb\xbf{\"is_Domain\":true}", false, kIsFalse);
        changed("other keys stay", R"({"z":{"a":[1,"终"]},"is_Domain":true,"server_ip":""})", false,
                kAmongOthers);
        same("still true", R"( {"is_Domain":true} )", true);
        same("still false", R"({"is_Domain":false})", false);
        same("text counts as false", R"({"is_Domain":"true"})", false);
        same("null counts as false", R"({"is_Domain":null})", false);
        refused("no such key", R"({"server_host":"s"})");
        refused("other letter case", R"({"is_domain":false})");
        refused("no JSON", "is_Domain=false");
        refused("array", R"([{"is_Domain":false}])");
        refused("empty", "");
    }

    void domainMembershipIsSaved()
    {
        QFETCH(QByteArray, before);
        QFETCH(bool, value);
        QFETCH(QString, line);
        writeBytes(kUserInfo, before);
        const LogRecorder log;
        QTEST(FileContent::saveDomain(value), "result");
        QTEST(readBytes(kUserInfo), "after");
        QCOMPARE(log.lines(), line.isEmpty() ? QStringList() : QStringList(line));
    }

    void valueIsUpdated_data()
    {
        QTest::addColumn<QByteArray>("before");
        QTest::addColumn<QByteArray>("after");

        const auto row = [](const char* name, const char* before, const char* after) {
            QTest::newRow(name) << QByteArray(before) << QByteArray(after);
        };
        const char* const alone = "{\n    \"terminal_name\": \"new\"\n}\n";
        row("added", R"({"a":1.5,"z":null})",
            "{\n    \"a\": 1.5,\n    \"terminal_name\": \"new\",\n    \"z\": null\n}\n");
        row("replaced", R"({"terminal_name":"old"})", alone);
        row("replaced whatever it was", R"({"terminal_name":{"a":1}})", alone);
        row("written even if unchanged", R"({"terminal_name":"new"})", alone);
        row("no JSON becomes an object", "terminal_name=old", alone);
        row("array becomes an object", "[1]", alone);
        row("empty becomes an object", "", alone);
    }

    void valueIsUpdated()
    {
        QFETCH(QByteArray, before);
        writeBytes(kUserInfo, before);
        const LogRecorder log;
        QVERIFY(updateUserInfo(QStringLiteral("terminal_name"), QStringLiteral("new")));
        QTEST(readBytes(kUserInfo), "after");
        QCOMPARE(log.lines(), QStringList());
    }

    void recordReplacesFile()
    {
        writeBytes(kUserInfo,
                   R"({"is_Domain":false,"server_ip":"10.0.0.1","other":1})" + QByteArray(9999, ' '));
        const LogRecorder log;
        QVERIFY(saveRecord());
        QCOMPARE(readBytes(kUserInfo), kRecord);
        QCOMPARE(log.lines(), QStringList());
    }

    void recordCreatesFile()
    {
        QVERIFY(FileContent::saveUserInfo(UserInfo()));
        QCOMPARE(readBytes(kUserInfo), QByteArray(R"({
    "domain_host": "",
    "domain_port": "",
    "is_Domain": false,
    "server_host": "",
    "server_port": "",
    "terminal_name": ""
}
)"));
    }
};

QTEST_GUILESS_MAIN(FileContentSaveTest)
#include "filecontent_save_test.moc"
