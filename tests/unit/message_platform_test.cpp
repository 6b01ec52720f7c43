#include <QTextCodec>
#include <QtTest>

#include "handleevent.h"
#include "log_recorder.h"
#include "message_platform.h"
#include "message_transfer.h"
#include "platform_files.h"
#include "pretended.h"

/// The message client on its own, as a domain user, with a platform that has no messages.
class MessagePlatformTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init() { m_server.forgetRequests(); }

    void cleanup()
    {
        pretendedUid().reset();
        pretendedTime().reset();
    }

    void userAboveTheLocalRangeIsDomainUser_data()
    {
        QTest::addColumn<uint>("uid");
        QTest::addColumn<bool>("expected");
        QTest::newRow("root") << 0U << false;
        QTest::newRow("last local") << 10000U << false;
        QTest::newRow("first of the domain") << 10001U << true;
        QTest::newRow("beyond a signed number") << 3000000000U << true;
    }

    void userAboveTheLocalRangeIsDomainUser()
    {
        QFETCH(uint, uid);
        pretendedUid() = uid;
        QTEST(m_platform.isLdapUser(), "expected");
        QTEST(m_transfer.isLdapUser(), "expected");
    }

    void startIsLogged()
    {
        const LogRecorder log;
        MessagePlatform platform(nullptr, QStringLiteral("a"), &m_transfer);
        const QString tips = m_server.url("demanding", "/uim/v3/client/password/tips");
        const QStringList expected{QStringLiteral("info: ---------load cfg"),
                                   QStringLiteral(R"(info: MessagePlatform app path "/usr/bin/velkm")"),
                                   QStringLiteral("info: url  \"%1\"").arg(tips)};
        QCOMPARE(log.lines().mid(0, 3), expected);
    }

    void unusualAddressIsUsedAsItIs()
    {
        writePlatformAddress("%2.box", "%1");
        const LogRecorder log;
        MessagePlatform platform(nullptr, QStringLiteral("a"), &m_transfer);
        platform.unreadMessages(QStringLiteral("a"), 1, 1);
        platform.messageRespond(QStringLiteral("u"));
        m_server.writeAddress();

        const QString base = QStringLiteral("\"https://%2.box:%1/");
        const QStringList addresses = log.lines().filter(base);
        QCOMPARE(addresses.size(), 3);
        QVERIFY(addresses.at(0).endsWith(base + QStringLiteral("uim/v3/client/password/tips\"")));
        QVERIFY(addresses.at(1).contains(base + QStringLiteral("notification/v2/list?uid=a&")));
        QVERIFY(addresses.at(2).contains(base + QStringLiteral("notification/v2/read?timestaps=")));
    }

    void pageGivesTheOffset_data()
    {
        QTest::addColumn<int>("page");
        QTest::addColumn<int>("offset");
        QTest::newRow("page 0 counts as page 1") << 0 << 0;
        QTest::newRow("page 1") << 1 << 0;
        QTest::newRow("page 2") << 2 << 10;
        QTest::newRow("page 3") << 3 << 20;
    }

    void pageGivesTheOffset()
    {
        QFETCH(int, page);
        QFETCH(int, offset);
        QCOMPARE(m_platform.getNotifyMessageList(QStringLiteral("a"), false, page, 10, {}), 0);
        QCOMPARE(nextList(),
                 QStringLiteral("/notification/v2/list?uid=a&is_not_read=0&limit=10&offset=%1"
                                "&order=create_at&desc=1")
                     .arg(offset));
    }

    void optionsAreSentInTheirOrder()
    {
        NotifyMessageOption option;
        option.uid = QStringLiteral("u");
        option.is_not_read = true;
        option.limit = 7;
        option.offset = -3;
        option.order = QStringLiteral("title");
        option.desc = QStringLiteral("0");
        QCOMPARE(m_platform.getNotifyMessageList(option, {}), 0);
        QCOMPARE(nextList(),
                 QStringLiteral("/notification/v2/list?uid=u&is_not_read=1&limit=7&offset=-3"
                                "&order=title&desc=0"));
    }

    void defaultOptionsAskForTenMessages()
    {
        m_platform.getNotifyMessageList(NotifyMessageOption(), {});
        QCOMPARE(nextList(),
                 QStringLiteral("/notification/v2/list?uid=&is_not_read=0&limit=10&offset=0"
                                "&order=create_at&desc=1"));
    }

    void unusualUserNameIsSentAsItIs_data()
    {
        QTest::addColumn<QString>("name");
        QTest::addColumn<QString>("sent");
        QTest::newRow("numbered place") << QStringLiteral("%2%8") << QStringLiteral("%2%8");
        QTest::newRow("signs") << QStringLiteral("a&b=c,\"d\"+@") << QStringLiteral("a&b=c,\"d\"+@");
        // These cannot stand in a request line.
        QTest::newRow("blank and line break") << QStringLiteral("a b\n") << QStringLiteral("a%20b%0A");
        QTest::newRow("Chinese") << QStringLiteral("张") << QStringLiteral("%E5%BC%A0");
        QTest::newRow("emoji") << QStringLiteral("😀") << QStringLiteral("%F0%9F%98%80");
    }

    void unusualUserNameIsSentAsItIs()
    {
        QFETCH(QString, name);
        QFETCH(QString, sent);
        m_platform.unreadMessages(name, 1, 1);
        QCOMPARE(nextList(),
                 QStringLiteral("/notification/v2/list?uid=") + sent
                     + QStringLiteral("&is_not_read=1&limit=1&offset=0&order=create_at&desc=1"));
    }

    void timeIsUnsignedInListsAndSignedInReceipts_data()
    {
        QTest::addColumn<qint64>("now");
        QTest::addColumn<QString>("inList");
        QTest::addColumn<QString>("inReceipt");
        const auto row = [](const char* name, qint64 now, const char* inList, const char* inReceipt) {
            QTest::newRow(name) << now << QString::fromLatin1(inList) << QString::fromLatin1(inReceipt);
        };
        row("today", 1800000000, "1800000000", "1800000000");
        row("last that fits a signed number", 2147483647, "2147483647", "2147483647");
        row("first that does not", 2147483648, "2147483648", "-2147483648");
    }

    void timeIsUnsignedInListsAndSignedInReceipts()
    {
        QFETCH(qint64, now);
        pretendedTime() = now;
        m_platform.unreadMessages(QStringLiteral("a"), 1, 1);
        QTEST(m_server.nextTarget().section(QStringLiteral("&timestaps="), 1), "inList");
        m_platform.messageRespond(QStringLiteral("u"));
        QTEST(m_server.nextTarget().section(QStringLiteral("?timestaps="), 1), "inReceipt");
    }

    void bodyIsReadInTheEncodingOfTheLocale()
    {
        auto* const before = QTextCodec::codecForLocale();
        QTextCodec::setCodecForLocale(QTextCodec::codecForName("ISO-8859-1"));
        m_platform.OnRecvMsg(200, QStringLiteral(R"([{"uuid":"u终"}])"), {});
        QTextCodec::setCodecForLocale(before);
        QCOMPARE(m_server.nextRequest()[QStringLiteral("body")].toString(),
                 QStringLiteral(R"({"uuid":"u?"})"));
    }

    void callbackIsNeverCalled()
    {
        bool called = false;
        const auto callback = [&called](bool, const NotifyMessageResponse&) { called = true; };
        m_platform.getNotifyMessageList(NotifyMessageOption(), callback);
        m_platform.getNotifyMessageList(QString(), true, 1, 1, callback);
        QVERIFY(!called);
    }

private:
    /// The path and query of the next list request, without its time.
    QString nextList() { return m_server.nextTarget().section(QStringLiteral("&timestaps="), 0, 0); }

    PlatformServer m_server;
    MessageTransfer m_transfer;
    MessagePlatform m_platform{nullptr, QStringLiteral("zhang.wei"), &m_transfer};
};

QTEST_GUILESS_MAIN(MessagePlatformTest)
#include "message_platform_test.moc"
