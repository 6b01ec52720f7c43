#include "http_outcome.h"
#include "tls_peer.h"

#include <QTimer>
#include <QtTest>

#include <fcntl.h>
#include <sys/socket.h>

/// Whether each TCP socket of this program is closed in the child processes that it starts.
static QList<bool> closedInChildProcesses()
{
    QList<bool> closed;
    for (int descriptor = 0; descriptor < FD_SETSIZE; ++descriptor) {
        sockaddr_storage address{};
        socklen_t size = sizeof(address);
        if (getsockname(descriptor, reinterpret_cast<sockaddr*>(&address), &size) == 0
            && address.ss_family == AF_INET) {
            closed << ((fcntl(descriptor, F_GETFD) & FD_CLOEXEC) != 0);
        }
    }
    return closed;
}

/// How requests use their connections, and what they do meanwhile to the program.
class HttpClientApiConnectionTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init();
    void cleanup();

    void hundred_requests_share_one_connection();
    void connects_anew_when_the_server_has_closed_data();
    void connects_anew_when_the_server_has_closed();
    void resumes_its_tls_session_on_a_new_connection();
    void serves_the_next_request_after_one_without_response();
    void speaks_http_1_1_to_a_server_that_prefers_http_2();
    void uses_no_proxy_of_the_environment();
    void follows_no_redirect();
    void delivers_no_event_while_a_request_runs();
    void child_processes_inherit_no_connection();

private:
    TlsPeer m_peer;
    std::unique_ptr<HttpClientApi> m_client;
};

void HttpClientApiConnectionTest::init()
{
    m_peer.forgetRequests();
    m_client = std::make_unique<HttpClientApi>(nullptr, false);
    m_client->setSSLConfig(m_peer.file("ca"), {}, {});
}

void HttpClientApiConnectionTest::cleanup()
{
    qunsetenv("https_proxy");
    qunsetenv("ALL_PROXY");
}

void HttpClientApiConnectionTest::hundred_requests_share_one_connection()
{
    QSet<int> handshakes;
    for (int i = 0; i < 100; ++i) {
        QCOMPARE(get(*m_client, m_peer.url("proper", "/plain")).status, 200);
        handshakes << m_peer.nextRequest()[QStringLiteral("handshake")].toInt();
    }
    QCOMPARE(handshakes.size(), 1);
}

void HttpClientApiConnectionTest::connects_anew_when_the_server_has_closed_data()
{
    QTest::addColumn<QString>("path");
    QTest::newRow("idle connection closed") << QStringLiteral("/idle-close");
    QTest::newRow("idle connection reset") << QStringLiteral("/idle-reset");
    QTest::newRow("close announced in the response") << QStringLiteral("/announced-close");
}

void HttpClientApiConnectionTest::connects_anew_when_the_server_has_closed()
{
    QFETCH(QString, path);

    QCOMPARE(get(*m_client, m_peer.url("proper", qUtf8Printable(path))).status, 200);
    QCOMPARE(put(*m_client, m_peer.url("proper", "/text"), QStringLiteral("{}")).status, 200);
}

void HttpClientApiConnectionTest::resumes_its_tls_session_on_a_new_connection()
{
    QCOMPARE(get(*m_client, m_peer.url("proper", "/announced-close")).status, 200);
    QCOMPARE(m_peer.nextRequest()[QStringLiteral("resumed")].toBool(), false);
    QCOMPARE(get(*m_client, m_peer.url("proper", "/plain")).status, 200);
    QCOMPARE(m_peer.nextRequest()[QStringLiteral("resumed")].toBool(), true);
}

void HttpClientApiConnectionTest::serves_the_next_request_after_one_without_response()
{
    QCOMPARE(get(*m_client, m_peer.url("proper", "/cut-length")).status, 0);
    QCOMPARE(get(*m_client, m_peer.url("proper", "/body-over-cap")).status, 0);
    QCOMPARE(get(*m_client, m_peer.url("proper", "/text")).reply, QStringLiteral("用户 ü {}"));
}

void HttpClientApiConnectionTest::speaks_http_1_1_to_a_server_that_prefers_http_2()
{
    QCOMPARE(get(*m_client, m_peer.url("proper", "/plain")).status, 200);
    QCOMPARE(m_peer.nextRequest()[QStringLiteral("protocol")].toString(), QStringLiteral("http/1.1"));
}

void HttpClientApiConnectionTest::uses_no_proxy_of_the_environment()
{
    const QByteArray nobody = m_peer.url("refusing", "").toUtf8().replace("https:", "http:");
    qputenv("https_proxy", nobody);
    qputenv("ALL_PROXY", nobody);
    QCOMPARE(get(*m_client, m_peer.url("proper", "/plain")).status, 200);
}

void HttpClientApiConnectionTest::follows_no_redirect()
{
    QCOMPARE(get(*m_client, m_peer.url("proper", "/redirect")).status, 302);
    QCOMPARE(get(*m_client, m_peer.url("proper", "/next")).status, 200);
    QCOMPARE(m_peer.nextRequest()[QStringLiteral("line")].toString(),
             QStringLiteral("GET /redirect HTTP/1.1"));
    QCOMPARE(m_peer.nextRequest()[QStringLiteral("line")].toString(), QStringLiteral("GET /next HTTP/1.1"));
}

void HttpClientApiConnectionTest::delivers_no_event_while_a_request_runs()
{
    QTimer timer;
    timer.setSingleShot(true);
    QSignalSpy fired(&timer, &QTimer::timeout);
    timer.start(0);
    QCOMPARE(get(*m_client, m_peer.url("proper", "/plain")).status, 200);
    QCOMPARE(fired.count(), 0);
    QVERIFY(fired.wait());
}

void HttpClientApiConnectionTest::child_processes_inherit_no_connection()
{
    QCOMPARE(get(*m_client, m_peer.url("proper", "/plain")).status, 200);
    QCOMPARE(closedInChildProcesses(), QList<bool>({true}));
}

QTEST_GUILESS_MAIN(HttpClientApiConnectionTest)
#include "httpclientapi_connection_test.moc"
