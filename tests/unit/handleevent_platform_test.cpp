#include <QTextCodec>
#include <QUrl>
#include <QtTest>

#include <algorithm>
#include <memory>

#include "handleevent.h"
#include "https_server.h"
#include "log_recorder.h"
#include "manual_clock.h"
#include "platform_files.h"
#include "recorded_service.h"

using Headers = QList<QPair<QByteArray, QByteArray>>;

namespace {

const char* const kNotice = "用户密码快过期了！！";

/// The address at which the server answers with this status and body.
QString said(const HttpsServer& server, int status, const QString& body)
{
    const QByteArray query =
        "/said?status=" + QByteArray::number(status) + "&body=" + QUrl::toPercentEncoding(body);
    return server.url("demanding", query.constData());
}

QString tips(const QString& code, const QString& result)
{
    return QStringLiteral(R"({"code":%1,"data":{"result":%2,"msg":"您的密码还有3天过期"}})")
        .arg(code, result);
}

/// How often the notice's line was logged.
int notices(const LogRecorder& log)
{
    const QString text = QString::fromUtf8(kNotice);
    const QStringList lines = log.lines();
    return static_cast<int>(std::count_if(lines.cbegin(), lines.cend(),
                                          [&text](const QString& line) { return line.endsWith(text); }));
}

} // namespace

/// Requests to the platform: what it is sent, and what becomes of its replies.
class HandleEventPlatformTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        qRegisterMetaType<Headers>("QList<QPair<QByteArray,QByteArray> >");
        setClockAhead(0);
        m_server = std::make_unique<HttpsServer>();
        installCertificates(*m_server);
        HandleEvent::GetInstance()->initHttpApi();
    }

    void init()
    {
        m_notifications = std::make_unique<RecordedService>(
            QDBusConnection::SessionBus, QStringLiteral("com.norix.kpx.Notification"), answerNothing);
        m_server->forgetRequests();
    }

    void cleanup() { m_notifications.reset(); }

    void secondInitKeepsTheConnection()
    {
        auto* event = HandleEvent::GetInstance();
        event->getPlatformMsg(said(*m_server, 200, QString()));
        event->initHttpApi();
        event->getPlatformMsg(said(*m_server, 200, QString()));
        const QString handshake = QStringLiteral("handshake");
        const QJsonValue first = m_server->nextRequest()[handshake];
        QCOMPARE(m_server->nextRequest()[handshake], first);
    }

    void replyIsLoggedAndThenReportedBeforeTheRequestReturns()
    {
        const LogRecorder log;
        QStringList linesWhenReported;
        const QObject receiver;
        connect(HandleEvent::GetInstance(), &HandleEvent::recvPlatformMsg, &receiver,
                [&linesWhenReported, &log] { linesWhenReported = log.lines(); });
        QSignalSpy replies(HandleEvent::GetInstance(), &HandleEvent::recvPlatformMsg);
        HandleEvent::GetInstance()->getPlatformMsg(said(*m_server, 404, QStringLiteral("[]")));
        QCOMPARE(linesWhenReported,
                 QStringList{QStringLiteral(R"(info: getPlatformMsg ----nCode: 404 : "[]" : 2)")});
        QCOMPARE(replies.count(), 1);
        QCOMPARE(replies.at(0).at(0), QVariant(404));
        QCOMPARE(replies.at(0).at(1), QVariant(QStringLiteral("[]")));
        QVERIFY(replies.at(0).at(2).value<Headers>().contains({"X-Said", "yes"}));
    }

    void requestWithoutResponseIsReportedAsStatusZero()
    {
        auto* event = HandleEvent::GetInstance();
        event->getPlatformMsg(said(*m_server, 200, QStringLiteral("a reply with headers")));
        QSignalSpy replies(event, &HandleEvent::recvPlatformMsg);
        QTest::ignoreMessage(QtWarningMsg,
                             QRegularExpression(QStringLiteral("^HTTP GET without a response")));
        QTest::ignoreMessage(QtInfoMsg, R"(getPlatformMsg ----nCode: 0 : "" : 0)");
        event->getPlatformMsg(QStringLiteral("https://127.0.0.1:1/"));
        QCOMPARE(replies.count(), 1);
        QCOMPARE(replies.at(0).at(0), QVariant(0));
        QVERIFY(replies.at(0).at(2).value<Headers>().isEmpty());
    }

    void answerIsPutAsJsonAndItsReplyDropped()
    {
        QSignalSpy replies(HandleEvent::GetInstance(), &HandleEvent::recvPlatformMsg);
        const QString body = QStringLiteral(R"({"uuid":"一 %1"})");
        HandleEvent::GetInstance()->respondPlatformMsg(m_server->url("demanding", "/broken"), body);
        const QJsonObject request = m_server->nextRequest();
        QCOMPARE(request[QStringLiteral("line")].toString(), QStringLiteral("PUT /broken HTTP/1.1"));
        QCOMPARE(request[QStringLiteral("body")].toString(), body);
        QCOMPARE(headerOf(request, "Content-Type"), QStringLiteral("application/json"));
        QCOMPARE(replies.count(), 0);
    }

    void passwordRequestCarriesTheUserName()
    {
        const QString url = m_server->url("demanding", "/plain");
        QTest::ignoreMessage(QtInfoMsg, qUtf8Printable(QStringLiteral("url  \"%1\"").arg(url)));
        HandleEvent::GetInstance()->getPasswdExpiredTime(url, QStringLiteral("张 \"%1\""));
        const QJsonObject request = m_server->nextRequest();
        QCOMPARE(request[QStringLiteral("line")].toString(), QStringLiteral("GET /plain HTTP/1.1"));
        QCOMPARE(request[QStringLiteral("body")].toString(),
                 QStringLiteral("{\n    \"username\": \"张 \\\"%1\\\"\"\n}\n"));
        QCOMPARE(headerOf(request, "Content-Type"), QStringLiteral("application/json"));
    }

    void passwordReplyIsReportedLikeAnyOther()
    {
        QSignalSpy replies(HandleEvent::GetInstance(), &HandleEvent::recvPlatformMsg);
        QTest::ignoreMessage(QtInfoMsg, R"(getPasswdExpiredTime ----nCode: 500 : "{}" : 2)");
        HandleEvent::GetInstance()->getPasswdExpiredTime(said(*m_server, 500, QStringLiteral("{}")),
                                                         QString());
        QCOMPARE(replies.count(), 1);
        QCOMPARE(replies.at(0).at(0), QVariant(500));
    }

    void passwordThatDoesNotExpireIsLoggedTwiceAndNotShown_data()
    {
        QTest::addColumn<int>("status");
        QTest::addColumn<QString>("body");
        const QString zero = QStringLiteral("0");
        const QString yes = QStringLiteral("true");
        QTest::newRow("result false") << 200 << tips(zero, QStringLiteral("false"));
        QTest::newRow("result as text") << 200 << tips(zero, QStringLiteral("\"true\""));
        QTest::newRow("result as number") << 200 << tips(zero, QStringLiteral("1"));
        QTest::newRow("status 201") << 201 << tips(zero, yes);
        QTest::newRow("status 500") << 500 << tips(zero, yes);
        QTest::newRow("code 1") << 200 << tips(QStringLiteral("1"), yes);
        QTest::newRow("code as text") << 200 << tips(QStringLiteral("\"0\""), yes);
        QTest::newRow("code is a fraction") << 200 << tips(QStringLiteral("0.5"), yes);
        QTest::newRow("code null") << 200 << tips(QStringLiteral("null"), yes);
        QTest::newRow("no code") << 200 << QStringLiteral(R"({"data":{"result":true,"msg":"m"}})");
        QTest::newRow("no data") << 200 << QStringLiteral(R"({"code":0,"result":true})");
        QTest::newRow("data is no object") << 200 << QStringLiteral(R"({"code":0,"data":true})");
        QTest::newRow("array") << 200 << QStringLiteral(R"([{"code":0,"data":{"result":true}}])");
    }

    void passwordThatDoesNotExpireIsLoggedTwiceAndNotShown()
    {
        QFETCH(int, status);
        QFETCH(QString, body);
        const LogRecorder log;
        HandleEvent::GetInstance()->getPasswdExpiredTime(said(*m_server, status, body), QString());
        setClockAhead(m_ahead += 120);
        QCoreApplication::processEvents();
        QCOMPARE(notices(log), 2);
        QVERIFY(m_notifications->calls().isEmpty());
    }

    void passwordReplyIsReadAsUtf8InAnyLocale()
    {
        const QString reply = tips(QStringLiteral("0"), QStringLiteral("true"));
        auto* const before = QTextCodec::codecForLocale();
        QTextCodec::setCodecForLocale(QTextCodec::codecForName("ISO-8859-1"));
        HandleEvent::GetInstance()->getPasswdExpiredTime(said(*m_server, 200, reply), QString());
        QTextCodec::setCodecForLocale(before);
        setClockAhead(m_ahead += 61);
        QTRY_COMPARE(m_notifications->calls().size(), 1);
        QCOMPARE(m_notifications->calls().constFirst().arguments().value(4),
                 QVariant(QStringLiteral("您的密码还有3天过期")));
    }

private:
    std::unique_ptr<HttpsServer> m_server;
    std::unique_ptr<RecordedService> m_notifications;
    int m_ahead = 0;
};

QTEST_GUILESS_MAIN(HandleEventPlatformTest)
#include "handleevent_platform_test.moc"
