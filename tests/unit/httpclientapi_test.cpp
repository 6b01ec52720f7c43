#include <QtTest>

#include <curl/curlver.h>

#include "http_outcome.h"
#include "https_server.h"

using Headers = QList<QPair<QByteArray, QByteArray>>;
Q_DECLARE_METATYPE(HttpRequest)

namespace {

const QString kNoHeader = QStringLiteral("no such header");

QString headerIn(const QJsonObject& request, const char* name)
{
    const QString value = headerOf(request, name);
    return value.isNull() ? kNoHeader : value;
}

} // namespace

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

    void requestHasItsContentAndItsLengthAndType_data()
    {
        QTest::addColumn<HttpRequest>("request");
        QTest::addColumn<QString>("body");
        QTest::addColumn<bool>("isJson");
        QTest::addColumn<QString>("line");
        QTest::addColumn<QString>("length");
        QTest::addColumn<QString>("type");

        const HttpRequest get = &HttpClientApi::getRequest;
        const HttpRequest put = &HttpClientApi::putRequest;
        const QString getLine = QStringLiteral("GET /plain HTTP/1.1");
        const QString putLine = QStringLiteral("PUT /plain HTTP/1.1");
        const QString object = QStringLiteral("{\"name\": \"张\"}");
        const QString json = QStringLiteral("application/json");
        QTest::newRow("GET") << get << object << true << getLine << QStringLiteral("15") << json;
        QTest::newRow("GET of nothing") << get << QString() << true << getLine << kNoHeader << kNoHeader;
        QTest::newRow("PUT") << put << object << true << putLine << QStringLiteral("15") << json;
        QTest::newRow("PUT of nothing")
            << put << QString() << true << putLine << QStringLiteral("0") << kNoHeader;
        QTest::newRow("not JSON") << put << object << false << putLine << QStringLiteral("15") << kNoHeader;
    }

    void requestHasItsContentAndItsLengthAndType()
    {
        QFETCH(HttpRequest, request);
        QFETCH(QString, body);
        QFETCH(bool, isJson);
        QCOMPARE(outcomeOf(request, *m_client, at("/plain"), body, isJson).status, 200);

        const QJsonObject sent = m_server.nextRequest();
        QTEST(sent[QStringLiteral("line")].toString(), "line");
        QCOMPARE(sent[QStringLiteral("body")].toString(), body);
        QTEST(headerIn(sent, "Content-Length"), "length");
        QTEST(headerIn(sent, "Content-Type"), "type");
    }

    void largeContentIsSentWithoutAskingFirst()
    {
        const QString body(2 * 1024 * 1024, QLatin1Char('x'));
        QCOMPARE(outcomeOf(&HttpClientApi::putRequest, *m_client, at("/plain"), body).status, 200);

        const QJsonObject sent = m_server.nextRequest();
        QCOMPARE(headerIn(sent, "Expect"), kNoHeader);
        QCOMPARE(headerIn(sent, "Content-Length"), QString::number(body.size()));
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

        QCOMPARE(get(*m_client, at(qUtf8Printable(path))).status, 200);
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
        QTest::newRow("/interim") << 200 << QStringLiteral("final");
        QTest::newRow("/trailers") << 200 << QStringLiteral("first second");
    }

    void statusAndBodyAreReturned()
    {
        QFETCH(int, status);
        QFETCH(QString, reply);

        const HttpOutcome outcome = get(*m_client, at(QTest::currentDataTag()));
        QCOMPARE(outcome.status, status);
        QCOMPARE(outcome.reply, reply);
        QCOMPARE(outcome.warnings, QStringList());
    }

    void bodyOf8MibIsAccepted()
    {
        const HttpOutcome outcome = get(*m_client, at("/body-at-cap"));
        QCOMPARE(outcome.status, 200);
        QCOMPARE(outcome.reply.size(), 8 * 1024 * 1024);
    }

    void headersAreThoseOfTheFinalResponseAsItSentThem_data()
    {
        QTest::addColumn<QString>("path");
        QTest::addColumn<Headers>("headers");

        QTest::newRow("order, case and duplicates")
            << QStringLiteral("/headers")
            << Headers{{"X-Total-Count", "5"}, {"x-lower", "a"},       {"X-UPPER", "b \t c"},
                       {"x-twice", "1"},       {"X-Twice", "2"},       {"x-twice", "1"},
                       {"X-Empty", ""},        {"Content-Length", "2"}};
        QTest::newRow("one header in two lines")
            << QStringLiteral("/folded") << Headers{{"X-Folded", "one two"}, {"Content-Length", "2"}};
        QTest::newRow("interim responses before it")
            << QStringLiteral("/interim") << Headers{{"X-Final", "yes"}, {"Content-Length", "5"}};
        QTest::newRow("trailers after it")
            << QStringLiteral("/trailers") << Headers{{"Transfer-Encoding", "chunked"}};
    }

    void headersAreThoseOfTheFinalResponseAsItSentThem()
    {
        QFETCH(QString, path);
        QTEST(get(*m_client, at(qUtf8Printable(path))).headers, "headers");
    }

    void headersOf250KibAreAccepted()
    {
        const HttpOutcome outcome = get(*m_client, at("/headers-within-cap"));
        QCOMPARE(outcome.status, 200);
        QCOMPARE(outcome.headers.size(), 251);
    }

    void headersAreThoseOfTheLastRequest()
    {
        QCOMPARE(get(*m_client, at("/headers")).headers.size(), 8);
        QCOMPARE(get(*m_client, at("/plain")).headers, Headers({{"Content-Length", "2"}}));
        QCOMPARE(get(*m_client, m_server.url("refusing", "/plain")).headers, Headers());
    }

    void withoutAWholeResponseThereIsNoneAndOneWarning_data()
    {
        QTest::addColumn<QString>("url");
        QTest::addColumn<QString>("cause");

        const auto row = [](const char* name, const QString& url, const char* cause) {
            QTest::newRow(name) << url << QString::fromUtf8(cause);
        };
        const QString withoutTls = at("/plain").replace(QStringLiteral("https:"), QStringLiteral("http:"));

        row("connection refused", m_server.url("refusing", "/plain"), "onnect");
        row("body shorter than its length", at("/cut-length"), "97 bytes (remaining|missing)");
        row("last chunk cut", at("/cut-chunk"), "outstanding read data remaining");
        row("connection broken off in the body", at("/cut-connection"), "97 bytes remaining|unexpected eof");
        row("connection reset in the header", at("/reset-header"), "reset by peer");
        row("connection reset in the body", at("/reset-body"), "reset by peer");
        row("body over 8 MiB", at("/body-over-cap"), "8 MiB");
        row("body over 8 MiB, length unknown", at("/chunks-over-cap"), "8 MiB");
        row("headers over 256 KiB", at("/headers-over-cap"), "256 KiB");
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
        const HttpOutcome outcome = get(*m_client, at("/until-break"));
#if LIBCURL_VERSION_NUM >= 0x080000
        QCOMPARE(summary(outcome), kNoResponse);
#else
        QCOMPARE(outcome.status, 200);
        QCOMPARE(outcome.reply, QStringLiteral("all of it"));
        QCOMPARE(outcome.warnings, QStringList());
#endif
    }

private:
    QString at(const char* path) const
    {
        return m_server.url("proper", path);
    }

    HttpsServer m_server;
    std::unique_ptr<HttpClientApi> m_client;
};

QTEST_GUILESS_MAIN(HttpClientApiTest)
#include "httpclientapi_test.moc"
