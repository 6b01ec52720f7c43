#include <QSet>
#include <QtTest>

#include <functional>

#include "file_rewriter.h"
#include "filecontent.h"
#include "files.h"
#include "information_files.h"
#include "log_recorder.h"

using velk::base::FileContent;

namespace {

constexpr int kFewestReads = 3000;

QByteArray userInfo(const QByteArray& value)
{
    QByteArray content = R"({"is_Domain":true,"server_port":"@","server_host":"@","domain_host":"@",)"
                         R"("domain_port":"@","terminal_name":"@"})";
    return content.replace('@', value) + '\n';
}

const QByteArray kShort = "old";
const QByteArray kLong = "a value of the new file, longer than that of the old one";

/// Reads often, and until each of these outcomes was seen; the test's time limit ends it otherwise. All the
/// outcomes that there were.
QSet<QString> readUntilSeen(const QSet<QString>& outcomes, const std::function<QString()>& read)
{
    const LogRecorder ignoredLog;
    QSet<QString> seen;
    for (int count = 0; count < kFewestReads || !seen.contains(outcomes); ++count) {
        seen << read();
    }
    return seen;
}

} // namespace

/// Reads while another process truncates and writes the file all the time, as the daemon may.
class FileContentConcurrentTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void hostAndPortBelongTogether()
    {
        const QString both = QStringLiteral("%1:%1");
        const QSet<QString> outcomes{both.arg(QString::fromLatin1(kShort)),
                                     both.arg(QString::fromLatin1(kLong)), QStringLiteral("none")};
        writeBytes(kUserInfo, userInfo(kShort));
        const FileRewriter daemon(kUserInfo, {userInfo(kLong), userInfo(kShort)});
        QCOMPARE(readUntilSeen(outcomes,
                               [] {
                                   QString host;
                                   QString port;
                                   const bool found = FileContent::getHostAndPort(host, port);
                                   return found ? QStringLiteral("%1:%2").arg(host, port)
                                                : QStringLiteral("none%1%2").arg(host, port);
                               }),
                 outcomes);
    }

    void recordIsOfOneWrite()
    {
        const QString all = QStringLiteral("%1 %1 %1 %1 %1");
        const QSet<QString> outcomes{all.arg(QString::fromLatin1(kShort)),
                                     all.arg(QString::fromLatin1(kLong)), QStringLiteral("    ")};
        writeBytes(kUserInfo, userInfo(kShort));
        const FileRewriter daemon(kUserInfo, {userInfo(kLong), userInfo(kShort)});
        QCOMPARE(readUntilSeen(outcomes,
                               [] {
                                   const auto info = FileContent::getUserInfo(nullptr);
                                   return QStringList{info.serverPort, info.serverHost, info.domainHost,
                                                      info.domainPort, info.terminalName}
                                       .join(QLatin1Char(' '));
                               }),
                 outcomes);
    }

    void identifierIsOneOfTheTwo()
    {
        const QSet<QString> outcomes{QStringLiteral("id-1"), QStringLiteral("id-2"), QString()};
        writeBytes(kMachineId, "id-1\n");
        const FileRewriter daemon(kMachineId, {"id-2\n", "id-1\n"});
        QCOMPARE(readUntilSeen(outcomes, [] { return FileContent::instace()->getMachineID(nullptr, true); }),
                 outcomes);
    }
};

QTEST_GUILESS_MAIN(FileContentConcurrentTest)
#include "filecontent_concurrent_test.moc"
