#include <QFile>
#include <QRegularExpression>
#include <QtTest>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <future>
#include <map>
#include <thread>

#include "httpclientapi.h"
#include "https_server.h"
#include "log_recorder.h"

namespace {

/// Far more than any limit of the client: only a request without limit is still waiting then.
constexpr std::chrono::seconds kPatience(90);

struct Outcome
{
    int status = -1;
    QString reply = QStringLiteral("left over from before");
    bool hasHeaders = true;
};

} // namespace

/// Peers that keep the client waiting, in real time. All requests run at once, so that the test takes as long
/// as the longest of them.
class HttpClientApiLimitsTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        // A name lookup reads this file first, and hangs on a pipe without a writer.
        QVERIFY(qEnvironmentVariableIsSet("VELK_BOX_USER")); // it is the machine's own file elsewhere
        QVERIFY(QFile::remove(QStringLiteral("/etc/hosts")));
        QCOMPARE(mkfifo("/etc/hosts", 0600), 0);

        m_log = std::make_unique<LogRecorder>();
        start("no header comes", m_server.url("proper", "/stalled-header"));
        start("body stops", m_server.url("proper", "/stalled-body"));
        start("body drips without end", m_server.url("proper", "/dripping-body"));
        start("name lookup hangs", QStringLiteral("https://platform.invalid/"));
        start("TLS handshake hangs", m_server.url("silent", "/plain"));
    }

    void givesUp_data()
    {
        QTest::addColumn<QString>("request");
        for (const auto& request : m_requests) {
            QTest::newRow(qUtf8Printable(request.first)) << request.first;
        }
    }

    void givesUp()
    {
        QFETCH(QString, request);

        const auto result = m_requests.at(request);
        QCOMPARE(result.wait_for(kPatience), std::future_status::ready);
        QCOMPARE(result.get().status, 0);
        QCOMPARE(result.get().reply, QString());
        QVERIFY(!result.get().hasHeaders);
    }

    void eachRequestGivenUpIsOneWarning()
    {
        for (const auto& request : m_requests) {
            QCOMPARE(request.second.wait_for(kPatience), std::future_status::ready);
        }
        const QStringList warnings = m_log->warnings();
        QCOMPARE(warnings.size(), 5);
        QCOMPARE(warnings.filter(QRegularExpression(QStringLiteral("timed out|timeout"))).size(), 5);
    }

    void connectingIsGivenUpBeforeTheRest()
    {
        const QStringList warnings = m_log->warnings();
        const QRegularExpression connecting(QStringLiteral("Resolving|SSL connection|Connection timed out"));
        QCOMPARE(warnings.mid(0, 2).filter(connecting).size(), 2);
    }

    void lookupLeftBehindReachesNoChildProcess()
    {
        for (int descriptor = STDERR_FILENO + 1; descriptor < FD_SETSIZE; ++descriptor) {
            struct stat found = {};
            if (fstat(descriptor, &found) == 0 && S_ISSOCK(found.st_mode)) {
                QVERIFY((fcntl(descriptor, F_GETFD) & FD_CLOEXEC) != 0);
            }
        }
    }

    void cleanupTestCase() { m_log.reset(); }

private:
    void start(const char* row, const QString& url)
    {
        std::packaged_task<Outcome()> request([url, authority = m_server.file("ca")] {
            HttpClientApi client(nullptr, false);
            client.setSSLConfig(authority, {}, {});
            Outcome outcome;
            outcome.status = client.getRequest(outcome.reply, url, {}, true);
            outcome.hasHeaders = !client.getRawHeader().isEmpty();
            return outcome;
        });
        m_requests[QString::fromUtf8(row)] = request.get_future().share();
        std::thread(std::move(request)).detach(); // one without limit must not keep the test from ending
    }

    HttpsServer m_server;
    std::unique_ptr<LogRecorder> m_log;
    std::map<QString, std::shared_future<Outcome>> m_requests;
};

QTEST_GUILESS_MAIN(HttpClientApiLimitsTest)
#include "httpclientapi_limits_test.moc"
