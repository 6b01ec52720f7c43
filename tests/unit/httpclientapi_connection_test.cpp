#include <QProcess>
#include <QTimer>
#include <QtTest>

#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>

#include "http_outcome.h"
#include "https_server.h"

namespace {

/// The TCP sockets of this program.
QList<int> connections()
{
    QList<int> found;
    for (int descriptor = 0; descriptor < FD_SETSIZE; ++descriptor) {
        sockaddr_storage address{};
        socklen_t size = sizeof(address);
        if (getsockname(descriptor, reinterpret_cast<sockaddr*>(&address), &size) == 0
            && address.ss_family == AF_INET) {
            found << descriptor;
        }
    }
    return found;
}

int option(int connection, int level, int name)
{
    int value = -1;
    socklen_t size = sizeof value;
    getsockopt(connection, level, name, &value, &size);
    return value;
}

/// What a child process finds open besides its standard streams.
QString descriptorsOfAChild()
{
    QProcess child;
    child.start(
        QStringLiteral("bash"),
        {QStringLiteral("-c"),
         QStringLiteral("for each in /proc/$$/fd/*; do ((${each##*/} < 3)) || readlink $each; done")});
    child.waitForFinished();
    return QString::fromUtf8(child.readAll());
}

} // namespace

/// How requests use their connections, and what they do meanwhile to the program.
class HttpClientApiConnectionTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_server.forgetRequests();
        m_client = std::make_unique<HttpClientApi>(nullptr, false);
        m_client->setSSLConfig(m_server.file("ca"), {}, {});
    }

    void cleanup()
    {
        qunsetenv("https_proxy");
        qunsetenv("ALL_PROXY");
    }

    void hundredRequestsShareOneConnection()
    {
        QSet<int> handshakes;
        for (int i = 0; i < 100; ++i) {
            QCOMPARE(get("/plain").status, 200);
            handshakes << m_server.nextRequest()[QStringLiteral("handshake")].toInt();
        }
        QCOMPARE(handshakes.size(), 1);
    }

    void connectsAnewWhenTheServerHasClosed_data()
    {
        QTest::addColumn<QString>("path");
        QTest::newRow("idle connection closed") << QStringLiteral("/idle-close");
        QTest::newRow("idle connection reset") << QStringLiteral("/idle-reset");
        QTest::newRow("close announced in the response") << QStringLiteral("/announced-close");
    }

    void connectsAnewWhenTheServerHasClosed()
    {
        QFETCH(QString, path);

        QCOMPARE(get(qUtf8Printable(path)).status, 200);
        QCOMPARE(put("/text").status, 200);
    }

    void sendsAgainWhatWentIntoADeadPath()
    {
        QCOMPARE(get("/idle-death").status, 200);
        QCOMPARE(put("/text").status, 200);
        const QJsonObject before = m_server.nextRequest();
        const QJsonObject after = m_server.nextRequest();
        QCOMPARE(after[QStringLiteral("line")].toString(), QStringLiteral("PUT /text HTTP/1.1"));
        QVERIFY(after[QStringLiteral("handshake")] != before[QStringLiteral("handshake")]);
    }

    void kernelWatchesAnIdleConnection()
    {
        constexpr int shortestPoll = 60;
        QCOMPARE(get("/plain").status, 200);
        QCOMPARE(connections().size(), 1);
        const int connection = connections().first();
        QCOMPARE(option(connection, SOL_SOCKET, SO_KEEPALIVE), 1);
        QVERIFY(option(connection, IPPROTO_TCP, TCP_KEEPIDLE) + option(connection, IPPROTO_TCP, TCP_KEEPINTVL)
                < shortestPoll);
        QCOMPARE(option(connection, IPPROTO_TCP, TCP_USER_TIMEOUT), 10000);
    }

    void resumesItsTlsSessionOnANewConnection_data()
    {
        QTest::addColumn<QString>("door");
        QTest::addColumn<QString>("version");
        QTest::newRow("TLS 1.3") << QStringLiteral("demanding") << QStringLiteral("TLSv1.3");
        QTest::newRow("TLS 1.2") << QStringLiteral("demanding older") << QStringLiteral("TLSv1.2");
    }

    void resumesItsTlsSessionOnANewConnection()
    {
        QFETCH(QString, door);
        QFETCH(QString, version);
        m_client->setSSLConfig(m_server.file("ca"), m_server.file("client"), m_server.file("client-key"));
        for (const bool isResumed : {false, true, true}) {
            QCOMPARE(get("/announced-close", qUtf8Printable(door)).status, 200);
            const QJsonObject request = m_server.nextRequest();
            QCOMPARE(request[QStringLiteral("tls")].toString(), version);
            QCOMPARE(request[QStringLiteral("resumed")].toBool(), isResumed);
        }
    }

    void servesTheNextRequestAfterOneWithoutResponse()
    {
        QCOMPARE(get("/cut-length").status, 0);
        QCOMPARE(get("/body-over-cap").status, 0);
        QCOMPARE(get("/text").reply, QStringLiteral("用户 ü {}"));
    }

    void speaksHttp11ToAServerThatPrefersHttp2()
    {
        QCOMPARE(get("/plain").status, 200);
        QCOMPARE(m_server.nextRequest()[QStringLiteral("protocol")].toString(), QStringLiteral("http/1.1"));
    }

    void usesNoProxyOfTheEnvironment()
    {
        const QByteArray closedPort = m_server.url("refusing", "").toUtf8().replace("https:", "http:");
        qputenv("https_proxy", closedPort);
        qputenv("ALL_PROXY", closedPort);
        QCOMPARE(get("/plain").status, 200);
    }

    void followsNoRedirect()
    {
        QCOMPARE(get("/redirect").status, 302);
        QCOMPARE(get("/next").status, 200);
        QCOMPARE(m_server.nextRequest()[QStringLiteral("line")].toString(),
                 QStringLiteral("GET /redirect HTTP/1.1"));
        QCOMPARE(m_server.nextRequest()[QStringLiteral("line")].toString(),
                 QStringLiteral("GET /next HTTP/1.1"));
    }

    void deliversNoEventWhileARequestRuns()
    {
        QTimer timer;
        timer.setSingleShot(true);
        QSignalSpy fired(&timer, &QTimer::timeout);
        timer.start(0);
        QCOMPARE(get("/plain").status, 200);
        QCOMPARE(fired.count(), 0);
        QVERIFY(fired.wait());
    }

    void childProcessesInheritNothing()
    {
        m_client.reset();
        const QString before = descriptorsOfAChild();
        init();
        QCOMPARE(get("/plain").status, 200);
        QCOMPARE(descriptorsOfAChild(), before);
    }

private:
    HttpOutcome get(const char* path, const char* door = "proper")
    {
        return outcomeOf(&HttpClientApi::getRequest, *m_client, m_server.url(door, path));
    }
    HttpOutcome put(const char* path)
    {
        return outcomeOf(&HttpClientApi::putRequest, *m_client, m_server.url("proper", path),
                         QStringLiteral("{}"));
    }

    HttpsServer m_server;
    std::unique_ptr<HttpClientApi> m_client;
};

QTEST_GUILESS_MAIN(HttpClientApiConnectionTest)
#include "httpclientapi_connection_test.moc"
