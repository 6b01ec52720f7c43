#include <QtTest>

#include "http_outcome.h"
#include "https_server.h"
#include "manual_clock.h"

/// A connection that the server keeps, as the time goes by.
class HttpClientApiIdleTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void connectionIsUsedAgainHoweverLongItWasIdle()
    {
        HttpsServer server;
        HttpClientApi client(nullptr, false);
        client.setSSLConfig(server.file("ca"), {}, {});
        for (const int seconds : {0, 119, 1'000, 100'000, 1'000'000}) {
            setClockAhead(seconds);
            QCOMPARE(get(client, server.url("proper", "/plain")).status, 200);
            QCOMPARE(server.nextRequest()[QStringLiteral("handshake")].toInt(), 1);
        }
    }
};

QTEST_GUILESS_MAIN(HttpClientApiIdleTest)
#include "httpclientapi_idle_test.moc"
