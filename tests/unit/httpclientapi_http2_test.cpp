#include <QTcpSocket>
#include <QtTest>

#include "files.h"
#include "http_outcome.h"
#include "https_server.h"

namespace {

// The simulated terminal has a network of its own: every port is free.
constexpr quint16 kPort = 9443;

const char* const kConfiguration = R"(
ServerRoot %1
ServerName localhost
PidFile %1/pid
DefaultRuntimeDir %1
ErrorLog /dev/stderr
Listen 127.0.0.1:%2
LoadModule mpm_event_module /usr/lib/apache2/modules/mod_mpm_event.so
LoadModule authz_core_module /usr/lib/apache2/modules/mod_authz_core.so
LoadModule headers_module /usr/lib/apache2/modules/mod_headers.so
LoadModule http2_module /usr/lib/apache2/modules/mod_http2.so
LoadModule ssl_module /usr/lib/apache2/modules/mod_ssl.so
Protocols h2 http/1.1
DocumentRoot %1/pages
SSLEngine on
SSLCertificateFile %3
SSLCertificateKeyFile %4
SSLCACertificateFile %5
SSLVerifyClient optional
<Location "/">
    Require ssl-verify-client
    Header always set X-Total-Count 5
    Header always set X-Protocol "expr=%{SERVER_PROTOCOL}"
</Location>
)";

bool accepts(quint16 port)
{
    QTcpSocket socket;
    socket.connectToHost(QStringLiteral("127.0.0.1"), port);
    return socket.waitForConnected();
}

} // namespace

/// Against a common web server, which demands a client certificate and offers HTTP/2.
class HttpClientApiHttp2Test : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        QVERIFY(QDir(m_folder.path()).mkdir(QStringLiteral("pages")));
        writeBytes(m_folder.filePath(QStringLiteral("pages/list")), "[]");
        const QString configuration = m_folder.filePath(QStringLiteral("server.conf"));
        writeBytes(configuration,
                   QString::fromUtf8(kConfiguration)
                       .arg(m_folder.path(), QString::number(kPort), m_certificates.file("server"),
                            m_certificates.file("server-key"), m_certificates.file("ca"))
                       .toUtf8());
        m_server.setProcessChannelMode(QProcess::ForwardedChannels);
        m_server.start(
            QStringLiteral("/usr/sbin/apache2"),
            {QStringLiteral("-D"), QStringLiteral("FOREGROUND"), QStringLiteral("-f"), configuration});
        QTRY_VERIFY(accepts(kPort));
    }

    void cleanupTestCase()
    {
        m_server.terminate();
        m_server.waitForFinished();
    }

    void isAnsweredOverHttp11WithHeaderNamesInTheirCase()
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

    void isTurnedAwayWithoutClientCertificate()
    {
        HttpClientApi client(nullptr, false);
        client.setSSLConfig(m_certificates.file("ca"), {}, {});
        QCOMPARE(get(client, url()).status, 403);
    }

private:
    QString url() const { return QStringLiteral("https://127.0.0.1:%1/list").arg(kPort); }

    HttpsServer m_certificates;
    QTemporaryDir m_folder;
    QProcess m_server;
};

QTEST_GUILESS_MAIN(HttpClientApiHttp2Test)
#include "httpclientapi_http2_test.moc"
