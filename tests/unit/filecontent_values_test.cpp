#include <QtTest>

#include "filecontent.h"
#include "files.h"
#include "information_files.h"
#include "log_recorder.h"

using velk::base::FileContent;

using FileChange = void (*)();
Q_DECLARE_METATYPE(FileChange)

namespace {

const QString kOldHost = QStringLiteral("host before");
const QString kOldPort = QStringLiteral("port before");

} // namespace

/// The single values of the user information: domain membership, alias, host and port.
class FileContentValuesTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init() { removeAny(kUserInfo); }

    void domainMembershipIsRead_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<bool>("isDomain");
        QTest::addColumn<bool>("ok");

        QTest::newRow("true") << QByteArray(R"({"is_Domain":true})") << true << true;
        QTest::newRow("false") << QByteArray(R"({"is_Domain":false})") << false << true;
        QTest::newRow("text") << QByteArray(R"({"is_Domain":"true"})") << true << true;
        QTest::newRow("null") << QByteArray(R"({"is_Domain":null})") << false << true;
        QTest::newRow("other letter case") << QByteArray(R"({"is_domain":true})") << false << false;
        QTest::newRow("byte order mark") << QByteArray("\xef\xbb\xbf{\"is_Domain\":true}") << true << true;
    }

    void domainMembershipIsRead()
    {
        QFETCH(QByteArray, content);
        writeBytes(kUserInfo, content);
        const LogRecorder log;
        bool ok = false;
        QTEST(FileContent::isDomain(&ok), "isDomain");
        QTEST(ok, "ok");
        QCOMPARE(log.lines(), ok ? QStringList() : QStringList(missingKey("isDomain", "is_Domain")));
    }

    void aliasIsRead_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<QString>("alias");
        QTest::addColumn<bool>("ok");

        QTest::newRow("text") << QByteArray(R"({"terminal_name":"终端 1"})") << QStringLiteral("终端 1")
                              << true;
        QTest::newRow("empty") << QByteArray(R"({"terminal_name":""})") << QString() << true;
        QTest::newRow("number") << QByteArray(R"({"terminal_name":17})") << QStringLiteral("17") << true;
        QTest::newRow("object") << QByteArray(R"({"terminal_name":{}})") << QString() << true;
        QTest::newRow("missing") << QByteArray(R"({"name":"a"})") << QString() << false;
    }

    void aliasIsRead()
    {
        QFETCH(QByteArray, content);
        writeBytes(kUserInfo, content);
        const LogRecorder log;
        bool ok = false;
        QTEST(FileContent::getTerminalAlias(&ok), "alias");
        QTEST(ok, "ok");
        QCOMPARE(log.lines(),
                 ok ? QStringList() : QStringList(missingKey("getTerminalAlias", "terminal_name")));
    }

    void hostAndPortAreRead_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<QString>("host");
        QTest::addColumn<QString>("port");
        QTest::addColumn<bool>("found");
        QTest::addColumn<QStringList>("log");

        const QString host = QStringLiteral("a.example");
        const QString port = QStringLiteral("8443");
        const QString noHost = missingKey("getHostAndPort", "server_host");
        const QString noPort = missingKey("getHostAndPort", "server_port");
        QTest::newRow("both") << QByteArray(R"({"server_host":"a.example","server_port":"8443"})") << host
                              << port << true << QStringList();
        QTest::newRow("port is a number") << QByteArray(R"({"server_host":"a.example","server_port":8443})")
                                          << host << port << true << QStringList();
        QTest::newRow("no port") << QByteArray(R"({"server_host":"a.example"})") << host << kOldPort << false
                                 << QStringList(noPort);
        QTest::newRow("no host") << QByteArray(R"({"server_port":"8443"})") << kOldHost << port << false
                                 << QStringList(noHost);
        QTest::newRow("neither") << QByteArray("{}") << kOldHost << kOldPort << false
                                 << QStringList{noHost, noPort};
    }

    void hostAndPortAreRead()
    {
        QFETCH(QByteArray, content);
        writeBytes(kUserInfo, content);
        const LogRecorder recorder;
        QString host = kOldHost;
        QString port = kOldPort;
        QTEST(FileContent::getHostAndPort(host, port), "found");
        QTEST(host, "host");
        QTEST(port, "port");
        QTEST(recorder.lines(), "log");
    }

    void fileThatIsNoObjectHoldsNothing_data()
    {
        QTest::addColumn<QByteArray>("content");

        QTest::newRow("empty") << QByteArray("");
        QTest::newRow("no JSON") << QByteArray("server_host=a.example\n");
        QTest::newRow("array") << QByteArray(R"([{"server_host":"a.example"}])");
        QTest::newRow("number") << QByteArray("17");
        QTest::newRow("text") << QByteArray(R"("server_host")");
        QTest::newRow("null") << QByteArray("null");
        // NOLINTNEXTLINE(modernize-raw-string-literal): moc loses the class after one with a lone brace
        QTest::newRow("cut off") << QByteArray("{\"server_host\":\"a.example\",\"server_");
        QTest::newRow("text after it") << QByteArray(R"({"server_host":"a.example"} x)");
        QTest::newRow("no UTF-8") << QByteArray("{\"server_host\":\"a.example\",\"x\":\"\xe9\xff\"}");
        QTest::newRow("binary") << QByteArray("\0\x01\xff\xfe{}", 6);
        QTest::newRow("UTF-16") << QByteArray("\xff\xfe{\0}\0", 6);
        QTest::newRow("deep") << QByteArray(200'000, '[');
        QTest::newRow("huge") << QByteArray(50'000'000, '{');
    }

    void fileThatIsNoObjectHoldsNothing()
    {
        QFETCH(QByteArray, content);
        writeBytes(kUserInfo, content);
        const LogRecorder log;
        QString host = kOldHost;
        QString port = kOldPort;
        QVERIFY(!FileContent::getHostAndPort(host, port));
        QCOMPARE(host, kOldHost);
        QCOMPARE(port, kOldPort);
        // Two missing keys, and nothing about the file itself.
        const QStringList expected{missingKey("getHostAndPort", "server_host"),
                                   missingKey("getHostAndPort", "server_port")};
        QCOMPARE(log.lines(), expected);
    }

    void unopenableFileIsLoggedAndCountsAsRead_data()
    {
        QTest::addColumn<FileChange>("prepare");
        QTest::addColumn<bool>("exists");

        const auto row = [](const char* name, bool exists, FileChange prepare) {
            QTest::newRow(name) << prepare << exists;
        };
        row("missing", false, [] { removeAny(kUserInfo); });
        row("unreadable", true, [] {
            writeBytes(kUserInfo, R"({"is_Domain":true,"server_host":"a","server_port":"1"})");
            setPermissions(kUserInfo, kNoAccess);
        });
        row("folder", true, [] { QDir().mkdir(kUserInfo); });
    }

    void unopenableFileIsLoggedAndCountsAsRead()
    {
        QFETCH(FileChange, prepare);
        QFETCH(bool, exists);
        prepare();
        const LogRecorder log;
        bool ok = false;
        QCOMPARE(FileContent::isDomain(&ok), false);
        QVERIFY(ok);
        ok = false;
        QCOMPARE(FileContent::getTerminalAlias(&ok), QString());
        QVERIFY(ok);
        QString host = kOldHost;
        QString port = kOldPort;
        QVERIFY(!FileContent::getHostAndPort(host, port)); // the one whose caller must not go on
        QCOMPARE(host + port, kOldHost + kOldPort);

        const QString failure = openFailure(kUserInfo, kReadMode, exists);
        const QStringList expected{failure, operationFailure("isDomain"),
                                   failure, operationFailure("getTerminalAlias"),
                                   failure, operationFailure("getHostAndPort")};
        QCOMPARE(log.lines(), expected);
    }

    void resultFlagMayBeNull()
    {
        const LogRecorder log;
        QCOMPARE(FileContent::isDomain(nullptr), false);
        QCOMPARE(FileContent::getTerminalAlias(nullptr), QString());
        writeBytes(kUserInfo, R"({"is_Domain":true,"terminal_name":"a"})");
        QCOMPARE(FileContent::isDomain(nullptr), true);
        QCOMPARE(FileContent::getTerminalAlias(nullptr), QStringLiteral("a"));
    }

    void hugeObjectIsRead()
    {
        writeBytes(kUserInfo,
                   R"({"filler":")" + QByteArray(50'000'000, 'a')
                       + R"(","server_host":"h","server_port":"1"})");
        QString host;
        QString port;
        QVERIFY(FileContent::getHostAndPort(host, port));
        QCOMPARE(host, QStringLiteral("h"));
        QCOMPARE(port, QStringLiteral("1"));
    }

    void everyReadSeesTheFileOfThatMoment()
    {
        bool ok = false;
        writeBytes(kUserInfo, R"({"terminal_name":"first"})");
        QCOMPARE(FileContent::getTerminalAlias(&ok), QStringLiteral("first"));
        writeBytes(kUserInfo, R"({"terminal_name":"second"})");
        QCOMPARE(FileContent::getTerminalAlias(&ok), QStringLiteral("second"));
    }

    void noHandleStaysOpen()
    {
        writeBytes(kUserInfo, R"({"is_Domain":true,"server_host":"h","server_port":"1"})");
        QString ignored;
        FileContent::isDomain(nullptr);
        FileContent::getHostAndPort(ignored, ignored);
        QCOMPARE(openHandles(kUserInfo), 0);
    }
};

QTEST_GUILESS_MAIN(FileContentValuesTest)
#include "filecontent_values_test.moc"
