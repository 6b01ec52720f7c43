#include <QDBusConnection>
#include <QDBusConnectionInterface>
#include <QSignalSpy>
#include <QTemporaryDir>
#include <QTest>

#include "files.h"
#include "launcher_guard.h"
#include "log_recorder.h"
#include "recorded_service.h"

namespace {

const QString service = QStringLiteral("com.norix.kpx.daemon.Launcher");
const QString path = QStringLiteral("/com/norix/kpx/daemon/Launcher");

} // namespace

/// What callers of the launcher's watcher see; the package tools find no packages here.
class LauncherGuardTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        registerLauncherItemInfoMetaType();
        registerLauncherItemInfoListMetaType();
    }

    void onlyAnArrayIsAnInventory_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<bool>("isInventory");
        QTest::newRow("no records") << QByteArray("[]") << true;
        QTest::newRow("an empty record") << QByteArray(" [{}]\n") << true;
        QTest::newRow("no record at all") << QByteArray("[5]") << true;
        QTest::newRow("object") << QByteArray("{}") << false;
        QTest::newRow("null") << QByteArray("null") << false;
        QTest::newRow("nothing") << QByteArray() << false;
        QTest::newRow("cut off") << QByteArray("[{}") << false;
        QTest::newRow("more than an array") << QByteArray("[] []") << false;
    }

    void onlyAnArrayIsAnInventory()
    {
        QFETCH(QByteArray, content);
        const QTemporaryDir folder;
        const QString path = folder.filePath(QStringLiteral("list"));
        writeBytes(path, content);
        QTEST(LauncherGuard(nullptr).getSoftwareList(path), "isInventory");
    }

    void missingFileIsNoInventory()
    {
        QVERIFY(!LauncherGuard(nullptr).getSoftwareList(QStringLiteral("/nowhere")));
    }

    void withoutANameThereIsNoVersion()
    {
        LauncherGuard guard(nullptr);
        const LogRecorder log;
        QCOMPARE(guard.getCurVersion(QString()), QStringLiteral("failed"));
        QCOMPARE(log.lines(), QStringList{QStringLiteral("warning: get version failed, empty packageName")});
    }

    void changedItemIsSignalledWithItsNameAndVersion()
    {
        const RecordedService launcher(QDBusConnection::SessionBus, service, answerNothing);
        const LauncherGuard guard(nullptr);
        QSignalSpy changed(&guard, &LauncherGuard::softwareChanged);
        const auto agent = QDBusConnection::sessionBus();
        // The bus answers once it has carried out what it was asked before: to pass the launcher's signals
        // on.
        agent.interface()->isServiceRegistered(service);

        const LauncherItemInfo item{
            QStringLiteral("/nowhere/editor.desktop"), QStringLiteral("编辑器"), {}, {}, 1, 2};
        const QString action = QStringLiteral("Any action");
        launcher.emitSignal(signalOf(path, service, "ItemChanged", {action, QVariant::fromValue(item), 7LL}),
                            agent);

        QTRY_COMPARE(changed.size(), 1);
        QCOMPARE(changed.first(),
                 (QVariantList{action, QStringList{QStringLiteral("编辑器"), QStringLiteral("failed")}}));
    }
};

QTEST_GUILESS_MAIN(LauncherGuardTest)
#include "launcher_guard_test.moc"
