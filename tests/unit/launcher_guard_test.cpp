#include <QDBusConnection>
#include <QDBusConnectionInterface>
#include <QSignalSpy>
#include <QTemporaryDir>
#include <QTest>

#include "files.h"
#include "launcher_guard.h"
#include "log_recorder.h"
#include "meta_order.h"
#include "recorded_service.h"

namespace {

const QString service = QStringLiteral("com.norix.kpx.daemon.Launcher");
const QString path = QStringLiteral("/com/norix/kpx/daemon/Launcher");

std::unique_ptr<RecordedService> newLauncher()
{
    return std::make_unique<RecordedService>(QDBusConnection::SessionBus, service, answerNothing);
}

/// What the guard signals when the launcher announces a change. All earlier changes have been signalled then.
QList<QVariantList> changesSignalledBy(const LauncherGuard& guard, const RecordedService& launcher)
{
    const auto agent = QDBusConnection::sessionBus();
    // The bus answers once it has carried out what it was asked before: to pass the signal on.
    agent.interface()->isServiceRegistered(service);
    QSignalSpy changed(&guard, &LauncherGuard::softwareChanged);

    const LauncherItemInfo item{
        QStringLiteral("/nowhere/editor.desktop"), QStringLiteral("编辑器"), {}, {}, 1, 2};
    const QVariantList change{QStringLiteral("Any action"), QVariant::fromValue(item), 7LL};
    launcher.emitSignal(signalOf(path, service, "ItemChanged", change), agent);
    if (changed.isEmpty()) {
        changed.wait();
    }
    return changed;
}

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

    void signalsAndSlotsStandInTheirOrder()
    {
        QCOMPARE(methodsInOrder(LauncherGuard::staticMetaObject),
                 (QStringList{QStringLiteral("softwareChanged(QString,QStringList)"),
                              QStringLiteral("softwareInited()"),
                              QStringLiteral("onItemChanged(QString,LauncherItemInfo,qlonglong)")}));
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

    void withoutALauncherThereAreNoItems()
    {
        const LogRecorder log;
        QVERIFY(LauncherGuard(nullptr).GetLauncerItems().isEmpty());
        QCOMPARE(log.lines(),
                 (QStringList{QStringLiteral("warning: launcher service is not registered, wait.."),
                              QStringLiteral("info: launcher service is not init")}));
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
        const auto launcher = newLauncher();
        const LauncherGuard guard(nullptr);
        const QStringList info{QStringLiteral("编辑器"), QStringLiteral("failed")};
        QCOMPARE(changesSignalledBy(guard, *launcher),
                 (QList<QVariantList>{{QStringLiteral("Any action"), info}}));
    }

    void launcherThatWasThereNeverArrives()
    {
        auto launcher = newLauncher();
        const LauncherGuard guard(nullptr);
        QSignalSpy inited(&guard, &LauncherGuard::softwareInited);

        launcher.reset();
        launcher = newLauncher();

        QCOMPARE(changesSignalledBy(guard, *launcher).size(), 1);
        QCOMPARE(inited.size(), 0);
    }

    void launcherArrivesOnce()
    {
        const LauncherGuard guard(nullptr);
        QSignalSpy inited(&guard, &LauncherGuard::softwareInited);
        auto launcher = newLauncher();
        QVERIFY(inited.wait());

        launcher.reset();
        launcher = newLauncher();

        QCOMPARE(changesSignalledBy(guard, *launcher).size(), 1);
        QCOMPARE(inited.size(), 1);
    }
};

QTEST_GUILESS_MAIN(LauncherGuardTest)
#include "launcher_guard_test.moc"
