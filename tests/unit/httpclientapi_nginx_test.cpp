#include "http_outcome.h"
#include "tls_peer.h"

#include <QFile>
#include <QTcpSocket>
#include <QtTest>

namespace {

// The simulated terminal has a network of its own: every port is free.
constexpr quint16 kPort = 9443;

const char* const kConfiguration = R"(
daemon off;
pid %1/nginx.pid;
error_log stderr;
events {}
http {
    access_log off;
    client_body_temp_path %1/body;
    proxy_temp_path %1/proxy;
    fastcgi_temp_path %1/fastcgi;
    uwsgi_temp_path %1/uwsgi;
    scgi_temp_path %1/scgi;
    server {
        listen 127.0.0.1:%2 ssl http2;
        ssl_certificate %3;
        ssl_certificate_key %4;
        ssl_client_certificate %5;
        ssl_verify_client on;
        location / {
            add_header X-Total-Count 5;
            add_header X-Protocol $server_protocol;
            return 200 "[]";
        }
    }
}
)";

bool accepts(quint16 port)
{
    QTcpSocket socket;
    socket.connectToHost(QStringLiteral("127.0.0.1"), port);
    return socket.waitForConnected();
}

} // namespace

/// Against a web server of somebody else's making, which demands a client certificate and offers HTTP/2.
class HttpClientApiNginxTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase();
    void cleanupTestCase();

    void is_answered_over_http_1_1_with_header_names_in_their_case();
    void is_turned_away_without_client_certificate();

private:
    QString url() const { return QStringLiteral("https://127.0.0.1:%1/list").arg(kPort); }

    TlsPeer m_certificates;
    QTemporaryDir m_folder;
    QProcess m_nginx;
};

void HttpClientApiNginxTest::initTestCase()
{
    QFile file(m_folder.filePath(QStringLiteral("nginx.conf")));
    QVERIFY(file.open(QIODevice::WriteOnly));
    file.write(QString::fromUtf8(kConfiguration)
                   .arg(m_folder.path(), QString::number(kPort), m_certificates.file("server"),
                        m_certificates.file("server-key"), m_certificates.file("ca"))
                   .toUtf8());
    file.close();

    m_nginx.setProcessChannelMode(QProcess::ForwardedChannels);
    m_nginx.start(QStringLiteral("/usr/sbin/nginx"),
                  {QStringLiteral("-e"), QStringLiteral("stderr"), QStringLiteral("-c"), file.fileName()});
    QTRY_VERIFY(accepts(kPort));
}

void HttpClientApiNginxTest::cleanupTestCase()
{
    m_nginx.terminate();
    m_nginx.waitForFinished();
}

void HttpClientApiNginxTest::is_answered_over_http_1_1_with_header_names_in_their_case()
{
    HttpClientApi client(nullptr, false);
    client.setSSLConfig(m_certificates.file("ca"), m_certificates.file("client"),
                        m_certificates.file("client-key"));
    const HttpOutcome outcome = get(client, url());
    QCOMPARE(outcome.status, 200);
    QCOMPARE(outcome.reply, QStringLiteral("[]"));
    QVERIFY(outcome.headers.contains({"X-Total-Count", "5"}));
    QVERIFY(outcome.headers.contains({"X-Protocol", "HTTP/1.1"}));
}

void HttpClientApiNginxTest::is_turned_away_without_client_certificate()
{
    HttpClientApi client(nullptr, false);
    client.setSSLConfig(m_certificates.file("ca"), {}, {});
    QCOMPARE(get(client, url()).status, 400);
}

QTEST_GUILESS_MAIN(HttpClientApiNginxTest)
#include "httpclientapi_nginx_test.moc"
