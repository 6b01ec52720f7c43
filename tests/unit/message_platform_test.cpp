#include <QtTest>

#include <QFile>
#include <QUrl>

#include <memory>

#include "message_platform.h"
#include "message_transfer.h"
#include "recorded_service.h"
#include "tls_peer.h"

/// The message client on its own, as a domain user, with a platform that has no messages.
class MessagePlatformTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase();
    void init();

    void intervalIsAtLeastTheShortestAndBelowTheLongest();
    void intervalBetweenEqualBoundsIsTheBound();
    void pageGivesTheOffset_data();
    void pageGivesTheOffset();
    void optionsAreSentInTheirOrder();
    void defaultOptionsAskForTenMessages();
    void unusualUserNameIsSentAsItIs_data();
    void unusualUserNameIsSentAsItIs();
    void callbackIsNeverCalled();
    void replyOnItsOwnAsksForTheNextAtOnce();
    void replyOfOneMessageAsksForNoOther();

private:
    /// The path and query of the next list request, without its time.
    QString nextList();

    std::unique_ptr<TlsPeer> m_peer;
    std::unique_ptr<MessageTransfer> m_transfer;
    std::unique_ptr<MessagePlatform> m_platform;
};

void MessagePlatformTest::initTestCase()
{
    m_peer = std::make_unique<TlsPeer>();
    const QString folder = QStringLiteral("/etc/velk/");
    QVERIFY(QFile::copy(m_peer->file("ca"), folder + QStringLiteral("clientapi_ca.crt")));
    QVERIFY(QFile::copy(m_peer->file("client"), folder + QStringLiteral("ZEF_Velk.pem")));
    QVERIFY(QFile::copy(m_peer->file("client-key"), folder + QStringLiteral(".ZEF_Velk.key")));

    QFile info(folder + QStringLiteral("userinfo.json"));
    QVERIFY(info.open(QIODevice::WriteOnly));
    const int port = QUrl(m_peer->url("demanding", "/")).port();
    info.write(R"({"server_host":"127.0.0.1","server_port":")" + QByteArray::number(port) + R"("})");
    info.close();

    m_transfer = std::make_unique<MessageTransfer>();
    m_platform = std::make_unique<MessagePlatform>(nullptr, QStringLiteral("zhang.wei"), m_transfer.get());
}

void MessagePlatformTest::init()
{
    m_peer->forgetRequests();
}

QString MessagePlatformTest::nextList()
{
    const QString line = m_peer->nextRequest()[QStringLiteral("line")].toString();
    return line.section(QLatin1Char(' '), 1, 1).section(QStringLiteral("&timestaps="), 0, 0);
}

void MessagePlatformTest::intervalIsAtLeastTheShortestAndBelowTheLongest()
{
    for (int max = 60001; max < 180000; max += 37) {
        const int interval = m_platform->generateRandnum(max, 60000);
        QVERIFY2(interval >= 60000 && interval < max, qPrintable(QString::number(interval)));
    }
}

void MessagePlatformTest::intervalBetweenEqualBoundsIsTheBound()
{
    QCOMPARE(m_platform->generateRandnum(60000, 60000), 60000);
}

void MessagePlatformTest::pageGivesTheOffset_data()
{
    QTest::addColumn<int>("page");
    QTest::addColumn<int>("offset");
    QTest::newRow("page 0 counts as page 1") << 0 << 0;
    QTest::newRow("page 1") << 1 << 0;
    QTest::newRow("page 2") << 2 << 10;
    QTest::newRow("page 3") << 3 << 20;
}

void MessagePlatformTest::pageGivesTheOffset()
{
    QFETCH(int, page);
    QFETCH(int, offset);
    QCOMPARE(m_platform->getNotifyMessageList(QStringLiteral("a"), false, page, 10, {}), 0);
    QCOMPARE(nextList(),
             QStringLiteral("/notification/v2/list?uid=a&is_not_read=0&limit=10&offset=%1"
                            "&order=create_at&desc=1")
                 .arg(offset));
}

void MessagePlatformTest::optionsAreSentInTheirOrder()
{
    NotifyMessageOption option;
    option.uid = QStringLiteral("u");
    option.is_not_read = true;
    option.limit = 7;
    option.offset = -3;
    option.order = QStringLiteral("title");
    option.desc = QStringLiteral("0");
    QCOMPARE(m_platform->getNotifyMessageList(option, {}), 0);
    QCOMPARE(nextList(),
             QStringLiteral("/notification/v2/list?uid=u&is_not_read=1&limit=7&offset=-3"
                            "&order=title&desc=0"));
}

void MessagePlatformTest::defaultOptionsAskForTenMessages()
{
    m_platform->getNotifyMessageList(NotifyMessageOption(), {});
    QCOMPARE(nextList(),
             QStringLiteral("/notification/v2/list?uid=&is_not_read=0&limit=10&offset=0"
                            "&order=create_at&desc=1"));
}

void MessagePlatformTest::unusualUserNameIsSentAsItIs_data()
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

void MessagePlatformTest::unusualUserNameIsSentAsItIs()
{
    QFETCH(QString, name);
    QFETCH(QString, sent);
    m_platform->unreadMessages(name, 1, 1);
    QCOMPARE(nextList(),
             QStringLiteral("/notification/v2/list?uid=") + sent
                 + QStringLiteral("&is_not_read=1&limit=1&offset=0&order=create_at&desc=1"));
}

void MessagePlatformTest::callbackIsNeverCalled()
{
    bool called = false;
    const auto callback = [&called](bool, const NotifyMessageResponse&) { called = true; };
    m_platform->getNotifyMessageList(NotifyMessageOption(), callback);
    m_platform->getNotifyMessageList(QString(), true, 1, 1, callback);
    QVERIFY(!called);
}

void MessagePlatformTest::replyOnItsOwnAsksForTheNextAtOnce()
{
    m_platform->OnRecvMsg(200, QString(), {{"X-Total-Count", "2"}});
    QVERIFY(
        nextList().startsWith(QLatin1String("/notification/v2/list?uid=zhang.wei&is_not_read=1&limit=1")));
}

void MessagePlatformTest::replyOfOneMessageAsksForNoOther()
{
    m_platform->OnRecvMsg(200, QString(), {{"X-Total-Count", "1"}});
    m_platform->messageRespond(QStringLiteral("marker"));
    QVERIFY(m_peer->nextRequest()[QStringLiteral("line")].toString().startsWith(QLatin1String("PUT ")));
}

QTEST_GUILESS_MAIN(MessagePlatformTest)
#include "message_platform_test.moc"
