#include <QtTest>

#include <curl/curlver.h>

#include "http_outcome.h"
#include "https_server.h"

using Headers = QList<QPair<QByteArray, QByteArray>>;

/// What a request sends, and what its caller gets of the response.
class HttpClientApiTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_server.forgetRequests();
        m_client = std::make_unique<HttpClientApi>(nullptr, false);
        m_client->setSSLConfig(m_server.file("ca"), {}, {});
    }

    void getWithoutBodyHasNoContent()
    {
        QCOMPARE(get(*m_client, m_server.url("proper", "/plain")).status, 200);

        const QJsonObject request = m_server.nextRequest();
        QCOMPARE(request[QStringLiteral("line")].toString(), QStringLiteral("GET /plain HTTP/1.1"));
        QVERIFY(headerOf(request, "Content-Length").isNull());
        QVERIFY(headerOf(request, "Content-Type").isNull());
    }

    void getCarriesItsBody()
    {
        const QString body = QStringLiteral("{\"username\": \"张伟\"}");
        QCOMPARE(get(*m_client, m_server.url("proper", "/plain"), body).status, 200);

        const QJsonObject request = m_server.nextRequest();
        QCOMPARE(request[QStringLiteral("line")].toString(), QStringLiteral("GET /plain HTTP/1.1"));
        QCOMPARE(request[QStringLiteral("body")].toString(), body);
        QCOMPARE(headerOf(request, "Content-Type"), QStringLiteral("application/json"));
    }

    void putCarriesItsBody()
    {
        const QString body = QStringLiteral("{\"uuid\":\"一\"}");
        QCOMPARE(put(*m_client, m_server.url("proper", "/plain"), body).status, 200);

        const QJsonObject request = m_server.nextRequest();
        QCOMPARE(request[QStringLiteral("line")].toString(), QStringLiteral("PUT /plain HTTP/1.1"));
        QCOMPARE(request[QStringLiteral("body")].toString(), body);
        QCOMPARE(headerOf(request, "Content-Type"), QStringLiteral("application/json"));
    }

    void putWithoutBodyDeclaresEmptyContent()
    {
        QCOMPARE(put(*m_client, m_server.url("proper", "/plain"), {}).status, 200);

        const QJsonObject request = m_server.nextRequest();
        QCOMPARE(request[QStringLiteral("line")].toString(), QStringLiteral("PUT /plain HTTP/1.1"));
        QCOMPARE(headerOf(request, "Content-Length"), QStringLiteral("0"));
        QVERIFY(headerOf(request, "Content-Type").isNull());
    }

    void contentThatIsNotJsonHasNoContentType()
    {
        QCOMPARE(put(*m_client, m_server.url("proper", "/plain"), QStringLiteral("text"), false).status, 200);

        const QJsonObject request = m_server.nextRequest();
        QCOMPARE(request[QStringLiteral("body")].toString(), QStringLiteral("text"));
        QVERIFY(headerOf(request, "Content-Type").isNull());
    }

    void largeContentIsSentWithoutAskingFirst()
    {
        const QString body(2 * 1024 * 1024, QLatin1Char('x'));
        QCOMPARE(put(*m_client, m_server.url("proper", "/plain"), body).status, 200);

        const QJsonObject request = m_server.nextRequest();
        QVERIFY(headerOf(request, "Expect").isNull());
        QCOMPARE(headerOf(request, "Content-Length"), QString::number(body.size()));
    }

    void urlGoesOutAsGivenButForCharactersThatARequestLineCannotCarry_data()
    {
        QTest::addColumn<QString>("path");
        QTest::addColumn<QString>("sent");

        const auto row = [](const char* name, const char* path, const char* sent) {
            QTest::newRow(name) << QString::fromUtf8(path) << QString::fromUtf8(sent);
        };
        row("query", "/list?uid=a&limit=1", "/list?uid=a&limit=1");
        row("blank", "/list?uid=a b", "/list?uid=a%20b");
        row("tabulator and line feed", "/a\tb\nc", "/a%09b%0Ac");
        row("delete character", "/a\x7f", "/a%7F");
        row("last plain character", "/a~", "/a~");
        row("two-byte character", "/ü", "/%C3%BC");
        row("Chinese", "/张?uid=伟", "/%E5%BC%A0?uid=%E4%BC%9F");
        row("beyond the basic plane", "/😀", "/%F0%9F%98%80");
        row("stray per cents", "/100%?a=%zz%", "/100%?a=%zz%");
        row("escapes in lower case", "/%c3%bc?a=%2f", "/%c3%bc?a=%2f");
        row("dot segments", "/a/../b/./c", "/a/../b/./c");
        row("punctuation", "/a\"<>[]\\^`{|}!$'()*,;:@", "/a\"<>[]\\^`{|}!$'()*,;:@");
        row("hash sign", "/?a=b#c&d=e", "/?a=b%23c&d=e");
        row("signs in the query", "/?a=b+c@d?e/f=", "/?a=b+c@d?e/f=");
    }

    void urlGoesOutAsGivenButForCharactersThatARequestLineCannotCarry()
    {
        QFETCH(QString, path);
        QFETCH(QString, sent);

        QCOMPARE(get(*m_client, m_server.url("proper", qUtf8Printable(path))).status, 200);
        QCOMPARE(m_server.nextRequest()[QStringLiteral("line")].toString(),
                 QStringLiteral("GET %1 HTTP/1.1").arg(sent));
    }

    void statusAndBodyAreReturned_data()
    {
        QTest::addColumn<int>("status");
        QTest::addColumn<QString>("reply");

        QTest::newRow("/text") << 200 << QStringLiteral("用户 ü {}");
        QTest::newRow("/empty") << 200 << QString();
        QTest::newRow("/no-content") << 204 << QString();
        QTest::newRow("/redirect") << 302 << QStringLiteral("elsewhere");
        QTest::newRow("/not-found") << 404 << QStringLiteral("no such thing");
        QTest::newRow("/broken") << 500 << QStringLiteral("out of order");
        QTest::newRow("/until-close") << 200 << QStringLiteral("all of it");
    }

    void statusAndBodyAreReturned()
    {
        QFETCH(int, status);
        QFETCH(QString, reply);

        const HttpOutcome outcome = get(*m_client, m_server.url("proper", QTest::currentDataTag()));
        QCOMPARE(outcome.status, status);
        QCOMPARE(outcome.reply, reply);
        QCOMPARE(outcome.warnings, QStringList());
    }

    void bodyOf8MibIsAccepted()
    {
        const HttpOutcome outcome = get(*m_client, m_server.url("proper", "/body-at-cap"));
        QCOMPARE(outcome.status, 200);
        QCOMPARE(outcome.reply.size(), 8 * 1024 * 1024);
    }

    void headersKeepTheirOrderCaseAndDuplicates()
    {
        const Headers sent = {{"X-Total-Count", "5"}, {"x-lower", "a"},       {"X-UPPER", "b \t c"},
                              {"x-twice", "1"},       {"X-Twice", "2"},       {"x-twice", "1"},
                              {"X-Empty", ""},        {"Content-Length", "2"}};
        QCOMPARE(get(*m_client, m_server.url("proper", "/headers")).headers, sent);
    }

    void foldedHeaderIsOneHeader()
    {
        const Headers joined = {{"X-Folded", "one two"}, {"Content-Length", "2"}};
        QCOMPARE(get(*m_client, m_server.url("proper", "/folded")).headers, joined);
    }

    void interimResponsesHaveNoPartInTheHeaders()
    {
        const HttpOutcome outcome = get(*m_client, m_server.url("proper", "/interim"));
        QCOMPARE(outcome.status, 200);
        QCOMPARE(outcome.headers, Headers({{"X-Final", "yes"}, {"Content-Length", "5"}}));
    }

    void trailersHaveNoPartInTheHeaders()
    {
        const HttpOutcome outcome = get(*m_client, m_server.url("proper", "/trailers"));
        QCOMPARE(outcome.reply, QStringLiteral("first second"));
        QCOMPARE(outcome.headers, Headers({{"Transfer-Encoding", "chunked"}}));
    }

    void headersOf250KibAreAccepted()
    {
        const HttpOutcome outcome = get(*m_client, m_server.url("proper", "/headers-within-cap"));
        QCOMPARE(outcome.status, 200);
        QCOMPARE(outcome.headers.size(), 251);
    }

    void headersAreThoseOfTheLastRequest()
    {
        QCOMPARE(get(*m_client, m_server.url("proper", "/headers")).headers.size(), 8);
        QCOMPARE(get(*m_client, m_server.url("proper", "/plain")).headers,
                 Headers({{"Content-Length", "2"}}));
        QCOMPARE(get(*m_client, m_server.url("refusing", "/plain")).headers, Headers());
    }

    void withoutAWholeResponseThereIsNoneAndOneWarning_data()
    {
        QTest::addColumn<QString>("url");
        QTest::addColumn<QString>("cause");

        const auto row = [](const char* name, const QString& url, const char* cause) {
            QTest::newRow(name) << url << QString::fromUtf8(cause);
        };
        const auto path = [this](const char* name) { return m_server.url("proper", name); };
        const QString withoutTls = path("/plain").replace(QStringLiteral("https:"), QStringLiteral("http:"));

        row("connection refused", m_server.url("refusing", "/plain"), "onnect");
        row("body shorter than its length", path("/cut-length"), "97 bytes (remaining|missing)");
        row("last chunk cut", path("/cut-chunk"), "outstanding read data remaining");
        row("connection broken off in the body", path("/cut-connection"),
            "97 bytes remaining|unexpected eof");
        row("connection reset in the header", path("/reset-header"), "reset by peer");
        row("connection reset in the body", path("/reset-body"), "reset by peer");
        row("body over 8 MiB", path("/body-over-cap"), "8 MiB");
        row("body over 8 MiB, length unknown", path("/chunks-over-cap"), "8 MiB");
        row("headers over 256 KiB", path("/headers-over-cap"), "256 KiB");
        row("address without TLS", withoutTls, "\"http\"");
        row("local file", QStringLiteral("file:///etc/passwd"), "\"file\"");
        row("empty address", QString(), "URL");
    }

    void withoutAWholeResponseThereIsNoneAndOneWarning()
    {
        QFETCH(QString, url);
        QFETCH(QString, cause);

        const HttpOutcome outcome = get(*m_client, url);
        QCOMPARE(summary(outcome), kNoResponse);
        QVERIFY2(outcome.warnings[0].contains(QRegularExpression(cause)),
                 qUtf8Printable(outcome.warnings[0]));
    }

    void replyWithoutLengthThatBreaksOffIsNoneWhereTheLibraryCanTell()
    {
        const HttpOutcome outcome = get(*m_client, m_server.url("proper", "/until-break"));
#if LIBCURL_VERSION_NUM >= 0x080000
        QCOMPARE(summary(outcome), kNoResponse);
#else
        QCOMPARE(outcome.status, 200);
        QCOMPARE(outcome.reply, QStringLiteral("all of it"));
        QCOMPARE(outcome.warnings, QStringList());
#endif
    }

private:
    HttpsServer m_server;
    std::unique_ptr<HttpClientApi> m_client;
};

QTEST_GUILESS_MAIN(HttpClientApiTest)
#include "httpclientapi_test.moc"
