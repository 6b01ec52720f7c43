#include "launcher_guard.h"
#include "log_recorder.h"
#include "meta_order.h"
#include "recorded_service.h"

#include <QDBusConnection>
#include <QDBusConnectionInterface>
#include <QSignalSpy>
#include <QTemporaryDir>
#include <QTest>

namespace {

const QString service = QStringLiteral("com.norix.kpx.daemon.Launcher");
const QString path = QStringLiteral("/com/norix/kpx/daemon/Launcher");

std::unique_ptr<RecordedService> newLauncher()
{
    return std::make_unique<RecordedService>(QDBusConnection::SessionBus, service, answerNothing);
}

/// What the guard tells when the launcher announces a change; all that happened before has then been told,
/// too.
QList<QVariantList> changesToldOf(const LauncherGuard& guard, const RecordedService& launcher)
{
    const auto agent = QDBusConnection::sessionBus();
    // The bus answers once it has carried out what it was asked before: to pass the signal on.
    agent.interface()->isServiceRegistered(service);
    QSignalSpy changed(&guard, &LauncherGuard::softwareChanged);

    const LauncherItemInfo item{
        QStringLiteral("/nowhere/editor.desktop"), QStringLiteral("编辑器"), {}, {}, 1, 2};
    auto signal = QDBusMessage::createSignal(path, service, QStringLiteral("ItemChanged"));
    signal << QStringLiteral("Any action") << QVariant::fromValue(item) << 7LL;
    launcher.emitSignal(signal, agent);
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
    void initTestCase();

    void signalsAndSlotsStandInTheirOrder();
    void onlyAnArrayIsAnInventory_data();
    void onlyAnArrayIsAnInventory();
    void missingFileIsNoInventory();
    void withoutALauncherThereAreNoItems();
    void withoutANameThereIsNoVersion();
    void changedItemIsToldWithItsNameAndVersion();
    void launcherThatWasThereNeverArrives();
    void launcherArrivesOnce();
};

void LauncherGuardTest::initTestCase()
{
    registerLauncherItemInfoMetaType();
    registerLauncherItemInfoListMetaType();
}

void LauncherGuardTest::signalsAndSlotsStandInTheirOrder()
{
    QCOMPARE(methodsInOrder(LauncherGuard::staticMetaObject),
             (QStringList{QStringLiteral("softwareChanged(QString,QStringList)"),
                          QStringLiteral("softwareInited()"),
                          QStringLiteral("onItemChanged(QString,LauncherItemInfo,qlonglong)")}));
}

void LauncherGuardTest::onlyAnArrayIsAnInventory_data()
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

void LauncherGuardTest::onlyAnArrayIsAnInventory()
{
    QFETCH(QByteArray, content);
    const QTemporaryDir folder;
    QFile file(folder.filePath(QStringLiteral("list")));
    QVERIFY(file.open(QIODevice::WriteOnly));
    file.write(content);
    file.close();
    QTEST(LauncherGuard(nullptr).getSoftwareList(file.fileName()), "isInventory");
}

void LauncherGuardTest::missingFileIsNoInventory()
{
    QVERIFY(!LauncherGuard(nullptr).getSoftwareList(QStringLiteral("/nowhere")));
}

void LauncherGuardTest::withoutALauncherThereAreNoItems()
{
    const LogRecorder log;
    QVERIFY(LauncherGuard(nullptr).GetLauncerItems().isEmpty());
    QCOMPARE(log.lines(),
             (QStringList{QStringLiteral("warning: launcher service is not registered, wait.."),
                          QStringLiteral("info: launcher service is not init")}));
}

void LauncherGuardTest::withoutANameThereIsNoVersion()
{
    LauncherGuard guard(nullptr);
    const LogRecorder log;
    QCOMPARE(guard.getCurVersion(QString()), QStringLiteral("failed"));
    QCOMPARE(log.lines(), QStringList{QStringLiteral("warning: get version failed, empty packageName")});
}

void LauncherGuardTest::changedItemIsToldWithItsNameAndVersion()
{
    const auto launcher = newLauncher();
    const LauncherGuard guard(nullptr);
    const QStringList info{QStringLiteral("编辑器"), QStringLiteral("failed")};
    QCOMPARE(changesToldOf(guard, *launcher), (QList<QVariantList>{{QStringLiteral("Any action"), info}}));
}

void LauncherGuardTest::launcherThatWasThereNeverArrives()
{
    auto launcher = newLauncher();
    const LauncherGuard guard(nullptr);
    QSignalSpy inited(&guard, &LauncherGuard::softwareInited);

    launcher.reset();
    launcher = newLauncher();

    QCOMPARE(changesToldOf(guard, *launcher).size(), 1);
    QCOMPARE(inited.size(), 0);
}

void LauncherGuardTest::launcherArrivesOnce()
{
    const LauncherGuard guard(nullptr);
    QSignalSpy inited(&guard, &LauncherGuard::softwareInited);
    auto launcher = newLauncher();
    QVERIFY(inited.wait());

    launcher.reset();
    launcher = newLauncher();

    QCOMPARE(changesToldOf(guard, *launcher).size(), 1);
    QCOMPARE(inited.size(), 1);
}

QTEST_GUILESS_MAIN(LauncherGuardTest)
#include "launcher_guard_test.moc"
