#include <QDir>
#include <QTest>

#include <poll.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <csignal>
#include <ctime>

#include "package_tool.h"

namespace {

// Waits of this program end after this part of their time.
constexpr int kShortening = 20;

/// Milliseconds that the program would have spent on waits that nothing ended.
long waited = 0;

/// The process that was last sent a signal, and the signal.
pid_t endedProcess = 0;
int endingSignal = 0;

bool endsWhenKilled = true;

long milliseconds(const timespec& time)
{
    return time.tv_sec * 1000 + time.tv_nsec / 1000000;
}

/// Whether one whole limit was waited for; real time that passed meanwhile is subtracted.
bool waitedOneLimit()
{
    return waited > 25000 && waited <= 30000;
}

bool exists(pid_t process)
{
    return QDir(QStringLiteral("/proc/%1").arg(process)).exists();
}

int openFiles()
{
    return QDir(QStringLiteral("/proc/self/fd")).entryList(QDir::Files | QDir::System).size();
}

PackageToolRun runScript(const char* script)
{
    return runPackageTool(QStringLiteral("sh"), {QStringLiteral("-c"), QString::fromUtf8(script)});
}

} // namespace

/// Replaces the C library's, by which Qt waits: shortens each wait; one that nothing ended counts in full.
// NOLINTNEXTLINE(readability-inconsistent-declaration-parameter-name)
int ppoll(pollfd* files, nfds_t count, const timespec* timeout, const sigset_t* mask)
{
    if (timeout == nullptr) {
        return static_cast<int>(syscall(SYS_ppoll, files, count, nullptr, mask, sizeof(long)));
    }
    const long whole = milliseconds(*timeout);
    const long part = whole / kShortening;
    timespec shortened{part / 1000, (part % 1000) * 1000000};
    const auto ready = static_cast<int>(syscall(SYS_ppoll, files, count, &shortened, mask, sizeof(long)));
    if (ready == 0) {
        waited += whole;
    }
    return ready;
}

/// Replaces the C library's, by which Qt ends programs.
// NOLINTNEXTLINE(readability-inconsistent-declaration-parameter-name)
int kill(pid_t process, int signal) noexcept
{
    endedProcess = process;
    endingSignal = signal;
    return endsWhenKilled ? static_cast<int>(syscall(SYS_kill, process, signal)) : 0;
}

/// Programs that end, and programs that do not; time runs fast while they are waited for. End-to-end tests
/// show what counts of their output.
class PackageToolTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        runScript("true"); // Qt keeps some files open from the first program on.
        m_openFiles = openFiles();
    }

    void init()
    {
        waited = 0;
        endedProcess = 0;
        endingSignal = 0;
        endsWhenKilled = true;
    }

    void cleanup() const
    {
        QTRY_VERIFY(endedProcess == 0 || !exists(endedProcess));
        QTRY_COMPARE(openFiles(), m_openFiles);
    }

    void programsOutputIsRead()
    {
        const PackageToolRun run = runScript("echo 编辑器; echo two");
        QVERIFY(run.ended);
        QCOMPARE(run.output, QStringLiteral("编辑器\ntwo\n"));
        QCOMPARE(waited, 0L);
        QCOMPARE(endedProcess, 0);
    }

    void argumentsArriveAsTheyStand()
    {
        const QStringList arguments{QStringLiteral("[%s]"), QStringLiteral("two words"), QString(),
                                    QStringLiteral("\"*'"), QStringLiteral("-x")};
        QCOMPARE(runPackageTool(QStringLiteral("printf"), arguments).output,
                 QStringLiteral("[two words][][\"*'][-x]"));
    }

    void givenEnvironmentIsTheWholeOne()
    {
        QProcessEnvironment environment;
        environment.insert(QStringLiteral("ONLY"), QStringLiteral("this"));
        QCOMPARE(runPackageTool(QStringLiteral("/usr/bin/env"), {}, environment).output,
                 QStringLiteral("ONLY=this\n"));
    }

    void inputStaysOpen()
    {
        // A program that reads it hangs until its limit.
        QVERIFY(!runScript("read line").ended);
    }

    void missingProgramIsNotWaitedFor()
    {
        const PackageToolRun run = runPackageTool(QStringLiteral("/nowhere/tool"), {});
        QVERIFY(!run.ended);
        QCOMPARE(run.output, QString());
        QCOMPARE(waited, 0L);
    }

    void hungProgramIsEndedAndNothingOfItIsLeft() const
    {
        runScript("trap '' TERM; while :; do sleep 0.1; done");
        QCOMPARE(endingSignal, SIGKILL);
        QTRY_VERIFY(!exists(endedProcess));
        QTRY_COMPARE(openFiles(), m_openFiles);
    }

    void programThatCannotBeEndedIsWaitedForUntilTheLimitAndNoLonger()
    {
        endsWhenKilled = false;
        QVERIFY(!runScript("exec sleep 1000").ended);
        QVERIFY(waitedOneLimit());
        QVERIFY(exists(endedProcess));
        syscall(SYS_kill, endedProcess, SIGKILL);
    }

private:
    int m_openFiles = 0;
};

QTEST_GUILESS_MAIN(PackageToolTest)
#include "package_tool_test.moc"
