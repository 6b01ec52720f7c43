#include <QtTest>

#include <QDBusVariant>
#include <QTextCodec>
#include <QUrl>

#include <sys/time.h>
#include <unistd.h>

#include <array>
#include <ctime>
#include <memory>
#include <optional>

#include "handleevent.h"
#include "log_recorder.h"
#include "message_platform.h"
#include "message_transfer.h"
#include "platform_files.h"
#include "recorded_service.h"
#include "tls_peer.h"

namespace {

QTimer* pollTimerOf(const MessagePlatform& platform);

/// An explicit instantiation may name what is private. The timer has no parent, so nothing else leads to it.
template <QTimer* MessagePlatform::*Member> struct PollTimer
{
    friend QTimer* pollTimerOf(const MessagePlatform& platform) { return platform.*Member; }
};
template struct PollTimer<&MessagePlatform::m_timer>;

/// What getuid() answers instead of the program's own uid.
std::optional<uid_t> pretendedUid;

/// The time of day that Qt reads instead of the clock's, in seconds since the epoch.
std::optional<time_t> pretendedTime;

// Seconds of different days, up to the last that the platform can be told.
constexpr std::array<time_t, 6> kMoments = {0, 1234567890, 1800000000, 1900012345, 2147483648, 4294967295};

/// The interval that the generator gives at the pretended time.
int intervalNow(int max, int min)
{
    QT_WARNING_PUSH
    QT_WARNING_DISABLE_DEPRECATED
    qsrand(static_cast<uint>(QTime::currentTime().msecsSinceStartOfDay() / 1000));
    return qrand() % (max - min) + min;
    QT_WARNING_POP
}

} // namespace

/// Both go before the C library's own.
uid_t getuid() noexcept
{
    return pretendedUid.value_or(geteuid());
}

// The header's names of the parameters are reserved.
// NOLINTNEXTLINE(readability-inconsistent-declaration-parameter-name)
int gettimeofday(timeval* now, void* /*zone*/) noexcept
{
    timespec clock{};
    clock_gettime(CLOCK_REALTIME, &clock);
    *now = {pretendedTime.value_or(clock.tv_sec), clock.tv_nsec / 1000};
    return 0;
}

/// The message client on its own, as a domain user, with a platform that has no messages.
class MessagePlatformTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase();
    void init();
    void cleanup();

    void userAboveTheLocalRangeIsDomainUser_data();
    void userAboveTheLocalRangeIsDomainUser();
    void startIsLogged();
    void pollTimerOutlivesTheClientAndPollsNoMore();
    void unusualAddressIsUsedAsItIs();
    void firstPollComesInOneToTwoMinutes();
    void activePollPutsTheNextOffByOneToThreeMinutes();
    void intervalIsDrawnWhenThePollIsOver();
    void idleSessionKeepsTheInterval();
    void intervalIsAtLeastTheShortestAndBelowTheLongest();
    void intervalBetweenEqualBoundsIsTheBound();
    void intervalDependsOnTheSecondOfTheDay();
    void pageGivesTheOffset_data();
    void pageGivesTheOffset();
    void optionsAreSentInTheirOrder();
    void defaultOptionsAskForTenMessages();
    void unusualUserNameIsSentAsItIs_data();
    void unusualUserNameIsSentAsItIs();
    void timeIsUnsignedInListsAndSignedInReceipts_data();
    void timeIsUnsignedInListsAndSignedInReceipts();
    void bodyIsReadInTheEncodingOfTheLocale();
    void callbackIsNeverCalled();

private:
    QString requestTarget();
    /// The path and query of the next list request, without its time.
    QString nextList();

    std::unique_ptr<TlsPeer> m_peer;
    std::unique_ptr<MessageTransfer> m_transfer;
    std::unique_ptr<MessagePlatform> m_platform;
};

void MessagePlatformTest::initTestCase()
{
    m_peer = std::make_unique<TlsPeer>();
    installCertificates(*m_peer);
    writePlatformAddress(*m_peer);

    m_transfer = std::make_unique<MessageTransfer>();
    m_platform = std::make_unique<MessagePlatform>(nullptr, QStringLiteral("zhang.wei"), m_transfer.get());
}

void MessagePlatformTest::init()
{
    m_peer->forgetRequests();
}

void MessagePlatformTest::cleanup()
{
    pretendedUid.reset();
    pretendedTime.reset();
}

QString MessagePlatformTest::requestTarget()
{
    return m_peer->nextRequest()[QStringLiteral("line")].toString().section(QLatin1Char(' '), 1, 1);
}

QString MessagePlatformTest::nextList()
{
    return requestTarget().section(QStringLiteral("&timestaps="), 0, 0);
}

void MessagePlatformTest::userAboveTheLocalRangeIsDomainUser_data()
{
    QTest::addColumn<uint>("uid");
    QTest::addColumn<bool>("expected");
    QTest::newRow("root") << 0U << false;
    QTest::newRow("last local") << 10000U << false;
    QTest::newRow("first of the domain") << 10001U << true;
    QTest::newRow("beyond a signed number") << 3000000000U << true;
}

void MessagePlatformTest::userAboveTheLocalRangeIsDomainUser()
{
    QFETCH(uint, uid);
    pretendedUid = uid;
    QTEST(m_platform->isLdapUser(), "expected");
}

void MessagePlatformTest::startIsLogged()
{
    const LogRecorder log;
    MessagePlatform platform(nullptr, QStringLiteral("a"), m_transfer.get());
    const QString tips = m_peer->url("demanding", "/uim/v3/client/password/tips");
    const QStringList expected{QStringLiteral("info: ---------load cfg"),
                               QStringLiteral(R"(info: MessagePlatform app path "/usr/bin/velkm")"),
                               QStringLiteral("info: url  \"%1\"").arg(tips)};
    QCOMPARE(log.lines().mid(0, 3), expected);
}

void MessagePlatformTest::pollTimerOutlivesTheClientAndPollsNoMore()
{
    auto platform = std::make_unique<MessagePlatform>(nullptr, QStringLiteral("a"), m_transfer.get());
    const QPointer<QTimer> timer = pollTimerOf(*platform);
    QVERIFY(timer->parent() == nullptr);
    platform.reset();
    QVERIFY(!timer.isNull());
    timer->start(0);
    const LogRecorder log;
    QVERIFY(QSignalSpy(timer, &QTimer::timeout).wait());
    QCOMPARE(log.lines(), QStringList());
    timer->stop();
}

void MessagePlatformTest::unusualAddressIsUsedAsItIs()
{
    writePlatformAddress("%2.box", "%1");
    const LogRecorder log;
    MessagePlatform platform(nullptr, QStringLiteral("a"), m_transfer.get());
    platform.unreadMessages(QStringLiteral("a"), 1, 1);
    platform.messageRespond(QStringLiteral("u"));
    writePlatformAddress(*m_peer);

    const QString base = QStringLiteral("\"https://%2.box:%1/");
    const QStringList addresses = log.lines().filter(base);
    QCOMPARE(addresses.size(), 3);
    QVERIFY(addresses.at(0).endsWith(base + QStringLiteral("uim/v3/client/password/tips\"")));
    QVERIFY(addresses.at(1).contains(base + QStringLiteral("notification/v2/list?uid=a&")));
    QVERIFY(addresses.at(2).contains(base + QStringLiteral("notification/v2/read?timestaps=")));
}

void MessagePlatformTest::firstPollComesInOneToTwoMinutes()
{
    for (const time_t moment : kMoments) {
        pretendedTime = moment;
        MessagePlatform platform(nullptr, QStringLiteral("a"), m_transfer.get());
        const QTimer* timer = pollTimerOf(platform);
        QVERIFY(timer->isActive() && !timer->isSingleShot());
        QCOMPARE(timer->interval(), intervalNow(120000, 60000));
    }
}

void MessagePlatformTest::activePollPutsTheNextOffByOneToThreeMinutes()
{
    const QTimer* timer = pollTimerOf(*m_platform);
    for (const time_t moment : kMoments) {
        pretendedTime = moment;
        QTest::ignoreMessage(QtInfoMsg, "screen state-----: 2");
        m_platform->onUnReadMessages();
        QVERIFY(timer->isActive() && !timer->isSingleShot());
        QCOMPARE(timer->interval(), intervalNow(180000, 60000));
    }
}

void MessagePlatformTest::intervalIsDrawnWhenThePollIsOver()
{
    pretendedTime = kMoments[1];
    const QObject receiver;
    connect(HandleEvent::GetInstance(), &HandleEvent::recvPlatformMsg, &receiver,
            [] { pretendedTime = kMoments[2]; });
    m_platform->onUnReadMessages();
    pretendedTime = kMoments[2];
    QCOMPARE(pollTimerOf(*m_platform)->interval(), intervalNow(180000, 60000));
}

void MessagePlatformTest::idleSessionKeepsTheInterval()
{
    const RecordedService screenSaver(
        QDBusConnection::SessionBus, QStringLiteral("com.norix.ScreenSaver"),
        [](const QDBusMessage& call) { return call.createReply(QVariant::fromValue(QDBusVariant(true))); });
    const QTimer* timer = pollTimerOf(*m_platform);
    const int before = timer->interval();
    for (const time_t moment : kMoments) {
        pretendedTime = moment;
        m_platform->onUnReadMessages();
        QVERIFY(timer->isActive());
        QCOMPARE(timer->interval(), before);
    }
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

void MessagePlatformTest::intervalDependsOnTheSecondOfTheDay()
{
    for (const time_t moment : kMoments) {
        pretendedTime = moment;
        QCOMPARE(m_platform->generateRandnum(99999, 7), intervalNow(99999, 7));
    }
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

void MessagePlatformTest::timeIsUnsignedInListsAndSignedInReceipts_data()
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

void MessagePlatformTest::timeIsUnsignedInListsAndSignedInReceipts()
{
    QFETCH(qint64, now);
    pretendedTime = now;
    m_platform->unreadMessages(QStringLiteral("a"), 1, 1);
    QTEST(requestTarget().section(QStringLiteral("&timestaps="), 1), "inList");
    m_platform->messageRespond(QStringLiteral("u"));
    QTEST(requestTarget().section(QStringLiteral("?timestaps="), 1), "inReceipt");
}

void MessagePlatformTest::bodyIsReadInTheEncodingOfTheLocale()
{
    auto* const before = QTextCodec::codecForLocale();
    QTextCodec::setCodecForLocale(QTextCodec::codecForName("ISO-8859-1"));
    m_platform->OnRecvMsg(200, QStringLiteral(R"([{"uuid":"u终"}])"), {});
    QTextCodec::setCodecForLocale(before);
    QCOMPARE(m_peer->nextRequest()[QStringLiteral("body")].toString(), QStringLiteral(R"({"uuid":"u?"})"));
}

void MessagePlatformTest::callbackIsNeverCalled()
{
    bool called = false;
    const auto callback = [&called](bool, const NotifyMessageResponse&) { called = true; };
    m_platform->getNotifyMessageList(NotifyMessageOption(), callback);
    m_platform->getNotifyMessageList(QString(), true, 1, 1, callback);
    QVERIFY(!called);
}

QTEST_GUILESS_MAIN(MessagePlatformTest)
#include "message_platform_test.moc"
