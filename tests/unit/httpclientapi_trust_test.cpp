#include <QDir>
#include <QProcess>
#include <QtTest>

#include <cstdio>

#include "files.h"
#include "http_outcome.h"
#include "https_server.h"

/// Which servers the client trusts, and which certificate it presents.
class HttpClientApiTrustTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    // OpenSSL's own default rules out what is older than TLS 1.2. Here it allows it, so that it is the client
    // that refuses.
    void initTestCase()
    {
        const QString config = m_folder.filePath(QStringLiteral("openssl.cnf"));
        writeBytes(config,
                   "openssl_conf = all\n[all]\nssl_conf = modules\n[modules]\nsystem_default = tls\n"
                   "[tls]\nMinProtocol = TLSv1\nCipherString = ALL:@SECLEVEL=0\n");
        qputenv("OPENSSL_CONF", QFile::encodeName(config));
    }

    void init()
    {
        m_server.forgetRequests();
        m_client = std::make_unique<HttpClientApi>(nullptr, false);
    }

    void refuses_data()
    {
        QTest::addColumn<QString>("door");
        QTest::addColumn<QString>("authority");
        QTest::addColumn<QString>("key");
        QTest::addColumn<QString>("cause");

        const QString ca = m_server.file("ca");
        const QString key = m_server.file("client-key");
        const QString none = m_folder.filePath(QStringLiteral("none"));
        const auto row = [](const char* name, const char* door, const QString& authority,
                            const QString& keyFile, const char* cause) {
            QTest::newRow(name) << QString::fromUtf8(door) << authority << keyFile
                                << QString::fromUtf8(cause);
        };
        row("server of another authority", "stranger", ca, key, "unable to get local issuer certificate");
        row("server of another name", "misnamed", ca, key, "no alternative certificate subject name matches");
        row("server whose certificate has expired", "expired", ca, key, "certificate has expired");
        row("server of TLS 1.1", "outdated", ca, key, "protocol version");
        // Whether its alert or the end of the connection comes first is a matter of timing: any cause will
        // do.
        row("server that demands a certificate", "demanding", ca, {}, "");
        row("missing authority file", "proper", none, key, "certificate file");
        row("authority file without certificate", "proper", key, key, "certificate file");
        row("missing key file", "demanding", ca, none, "private key");
    }

    void refuses()
    {
        QFETCH(QString, door);
        QFETCH(QString, authority);
        QFETCH(QString, key);
        QFETCH(QString, cause);

        m_client->setSSLConfig(authority, key.isEmpty() ? QString() : m_server.file("client"), key);
        const HttpOutcome outcome = plainGet(qUtf8Printable(door));
        QCOMPARE(summary(outcome), kNoResponse);
        QVERIFY2(outcome.warnings[0].contains(cause), qUtf8Printable(outcome.warnings[0]));
    }

    void refusesAnAuthorityThatOnlyTheSystemTrusts()
    {
        // Outside of the simulated terminal this would be the machine's own trust.
        QVERIFY(qEnvironmentVariableIsSet("VELK_BOX_USER"));
        const QDir trusted(QStringLiteral("/etc/ssl/certs"));
        QVERIFY(trusted.mkpath(QStringLiteral(".")));
        const QByteArray stranger = readBytes(m_server.file("stranger-ca"));
        writeBytes(trusted.filePath(QStringLiteral("stranger.pem")), stranger);
        QCOMPARE(
            QProcess::execute(QStringLiteral("/usr/bin/openssl"), {QStringLiteral("rehash"), trusted.path()}),
            0);

        m_client->setSSLConfig(m_server.file("ca"), {}, {});
        QCOMPARE(plainGet("stranger").status, 0);
    }

    void refusesWithoutConfiguration() { QCOMPARE(plainGet("proper").status, 0); }

    void asksForNoPasswordOfAKey()
    {
        const QString answer = m_folder.filePath(QStringLiteral("answer"));
        writeBytes(answer, "secret\n");
        QVERIFY(std::freopen(qUtf8Printable(answer), "r", stdin) != nullptr);

        m_client->setSSLConfig(m_server.file("ca"), m_server.file("client"), m_server.file("encrypted-key"));
        QCOMPARE(summary(plainGet("demanding")), kNoResponse);
    }

    void trustsTheGivenAuthority()
    {
        m_client->setSSLConfig(m_server.file("stranger-ca"), {}, {});
        QCOMPARE(plainGet("stranger").status, 200);
    }

    void readsAReplacedAuthorityFile()
    {
        const QString authority = m_folder.filePath(QStringLiteral("authority.pem"));
        m_client->setSSLConfig(authority, {}, {});
        writeBytes(authority, readBytes(m_server.file("stranger-ca")));
        QCOMPARE(plainGet("proper").status, 0);
        writeBytes(authority, readBytes(m_server.file("ca")));
        QCOMPARE(plainGet("proper").status, 200);
    }

    void presentsItsCertificate()
    {
        m_client->setSSLConfig(m_server.file("ca"), m_server.file("client"), m_server.file("client-key"));
        QCOMPARE(plainGet("demanding").status, 200);
        QCOMPARE(clientOfNextRequest(), QStringLiteral("terminal"));
    }

    void findsTheKeyInTheFileOfTheCertificate()
    {
        const QString both = m_folder.filePath(QStringLiteral("both.pem"));
        writeBytes(both, readBytes(m_server.file("client")) + readBytes(m_server.file("client-key")));
        m_client->setSSLConfig(m_server.file("ca"), both, {});
        QCOMPARE(plainGet("demanding").status, 200);
    }

    void presentsTheCertificateOfItsLatestConfiguration()
    {
        m_client->setSSLConfig(m_server.file("ca"), {}, {});
        QCOMPARE(plainGet("proper").status, 200);
        QCOMPARE(clientOfNextRequest(), QString());

        m_client->setSSLConfig(m_server.file("ca"), m_server.file("client"), m_server.file("client-key"));
        QCOMPARE(plainGet("proper").status, 200);
        QCOMPARE(clientOfNextRequest(), QStringLiteral("terminal"));
    }

private:
    HttpOutcome plainGet(const char* door) { return get(*m_client, m_server.url(door, "/plain")); }
    QString clientOfNextRequest() { return m_server.nextRequest()[QStringLiteral("client")].toString(); }

    HttpsServer m_server;
    QTemporaryDir m_folder;
    std::unique_ptr<HttpClientApi> m_client;
};

QTEST_GUILESS_MAIN(HttpClientApiTrustTest)
#include "httpclientapi_trust_test.moc"
