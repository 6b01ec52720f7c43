#include "libvelkkpx.h"
#include "log_recorder.h"
#include "recorded_service.h"

#include <QDir>
#include <QSettings>
#include <QTemporaryDir>
#include <QtTest>

namespace {

using SwitchSetter = QString (Libvelkkpx::*)(bool);

const QString kLoginManager = QStringLiteral("org.freedesktop.login1");
const QString kFile = QStringLiteral("norix/desktop-control.ini");

QVariant stored(const QString& path, const QString& key)
{
    return QSettings(path, QSettings::IniFormat).value(QStringLiteral("restrictions/") + key);
}

QByteArray contentOf(const QString& path)
{
    QFile file(path);
    file.open(QIODevice::ReadOnly);
    return file.readAll();
}

} // namespace

Q_DECLARE_METATYPE(SwitchSetter)

class LibvelkkpxTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init();

    void switchIsKeptUnderItsName_data();
    void switchIsKeptUnderItsName();
    void hotspotIsKeptAsNumber();
    void controlCenterListsAreKept();
    void listOfOneEmptyStringStaysOne();
    void fileIsInTheHomeFolderWithoutConfigurationFolder_data();
    void fileIsInTheHomeFolderWithoutConfigurationFolder();
    void otherContentOfTheFileIsKept();
    void switchThatCannotBeKeptReturnsTheError();
    void switchIsKeptAlthoughTheFileWasDamaged();
    void listsAndHotspotThatCannotBeKeptAreOneWarningEach();

    void rebootAsksTheLoginManager();
    void logoutEndsTheOwnSession();
    void callThatFailsIsOneWarning_data();
    void callThatFailsIsOneWarning();
    void absentLoginManagerIsOneWarning();

private:
    std::unique_ptr<QTemporaryDir> m_folder;
    QString m_file;
    Libvelkkpx m_control;
};

void LibvelkkpxTest::init()
{
    m_folder = std::make_unique<QTemporaryDir>();
    m_file = m_folder->filePath(kFile);
    qputenv("XDG_CONFIG_HOME", QFile::encodeName(m_folder->path()));
}

void LibvelkkpxTest::switchIsKeptUnderItsName_data()
{
    QTest::addColumn<SwitchSetter>("set");
    QTest::newRow("ShortcutKeyEnable") << &Libvelkkpx::SetShortcutKeyEnable;
    QTest::newRow("LauncherDisplayable") << &Libvelkkpx::SetLauncherDisplayable;
    QTest::newRow("TaskbarRightclickMenuEnable") << &Libvelkkpx::SetTaskbarRightclickMenuEnable;
    QTest::newRow("ResidentTaskbarAppDisplayable") << &Libvelkkpx::SetResidentTaskbarAppDisplayable;
    QTest::newRow("RecycleBinDisplayable") << &Libvelkkpx::SetRecycleBinDisplayable;
    QTest::newRow("WebTrayIconClickable") << &Libvelkkpx::SetWebTrayIconClickable;
    QTest::newRow("UsbTrayIconClickable") << &Libvelkkpx::SetUsbTrayIconClickable;
}

void LibvelkkpxTest::switchIsKeptUnderItsName()
{
    QFETCH(SwitchSetter, set);
    const QByteArray key = QTest::currentDataTag();

    QCOMPARE((m_control.*set)(true), QString());
    QCOMPARE(contentOf(m_file), "[restrictions]\n" + key + "=true\n");
    QCOMPARE((m_control.*set)(false), QString());
    QCOMPARE(contentOf(m_file), "[restrictions]\n" + key + "=false\n");
}

void LibvelkkpxTest::hotspotIsKeptAsNumber()
{
    m_control.SetHotspotEnable(1);
    QCOMPARE(contentOf(m_file), QByteArray("[restrictions]\nHotspotEnable=1\n"));
    m_control.SetHotspotEnable(0);
    QCOMPARE(contentOf(m_file), QByteArray("[restrictions]\nHotspotEnable=0\n"));
}

void LibvelkkpxTest::controlCenterListsAreKept()
{
    const QStringList modules = {QStringLiteral("network"), QStringLiteral("账户, all")};
    const QStringList extra = {QStringLiteral("a"), QString(), QStringLiteral("b")};
    m_control.SetControlConfig(modules, extra);
    QCOMPARE(stored(m_file, QStringLiteral("ControlCenterList")).toStringList(), modules);
    QCOMPARE(stored(m_file, QStringLiteral("ControlCenterExtra")).toStringList(), extra);
}

void LibvelkkpxTest::listOfOneEmptyStringStaysOne()
{
    m_control.SetControlConfig({}, {QString()});
    QCOMPARE(stored(m_file, QStringLiteral("ControlCenterList")).toStringList(), QStringList());
    QCOMPARE(stored(m_file, QStringLiteral("ControlCenterExtra")).toStringList(), QStringList(QString()));
}

void LibvelkkpxTest::fileIsInTheHomeFolderWithoutConfigurationFolder_data()
{
    QTest::addColumn<bool>("set");
    QTest::newRow("variable not set") << false;
    QTest::newRow("variable empty") << true;
}

void LibvelkkpxTest::fileIsInTheHomeFolderWithoutConfigurationFolder()
{
    QFETCH(bool, set);
    const QByteArray home = qgetenv("HOME");
    qputenv("HOME", QFile::encodeName(m_folder->path()));
    set ? qputenv("XDG_CONFIG_HOME", "") : qunsetenv("XDG_CONFIG_HOME");

    QCOMPARE(m_control.SetLauncherDisplayable(true), QString());
    qputenv("HOME", home);
    QCOMPARE(
        stored(m_folder->filePath(QStringLiteral(".config/") + kFile), QStringLiteral("LauncherDisplayable")),
        QVariant(QStringLiteral("true")));
}

void LibvelkkpxTest::otherContentOfTheFileIsKept()
{
    QVERIFY(QDir(m_folder->path()).mkdir(QStringLiteral("norix")));
    QFile file(m_file);
    QVERIFY(file.open(QIODevice::WriteOnly));
    file.write("[look]\ntheme=dark\n\n[restrictions]\nHotspotEnable=0\nLauncherDisplayable=false\nOther=x\n");
    file.close();

    QCOMPARE(m_control.SetLauncherDisplayable(true), QString());
    QCOMPARE(contentOf(m_file),
             QByteArray("[look]\ntheme=dark\n\n[restrictions]\nHotspotEnable=0\n"
                        "LauncherDisplayable=true\nOther=x\n"));
}

static void makeUnwritable(const QTemporaryDir& folder)
{
    // A file where the folder should be stops every user, root included.
    QFile obstacle(folder.filePath(QStringLiteral("norix")));
    QVERIFY(obstacle.open(QIODevice::WriteOnly));
}

void LibvelkkpxTest::switchThatCannotBeKeptReturnsTheError()
{
    makeUnwritable(*m_folder);
    const LogRecorder recorder;
    QCOMPARE(m_control.SetLauncherDisplayable(true), QStringLiteral("cannot write ") + m_file);
    QCOMPARE(recorder.warnings(), QStringList());
}

void LibvelkkpxTest::switchIsKeptAlthoughTheFileWasDamaged()
{
    QVERIFY(QDir(m_folder->path()).mkdir(QStringLiteral("norix")));
    QFile file(m_file);
    QVERIFY(file.open(QIODevice::WriteOnly));
    file.write("not INI at all\n[restrictions]\nOther=x\n");
    file.close();

    QCOMPARE(m_control.SetLauncherDisplayable(true),
             QStringLiteral("lines that are not INI are lost from ") + m_file);
    QCOMPARE(contentOf(m_file), QByteArray("[restrictions]\nLauncherDisplayable=true\nOther=x\n"));
}

void LibvelkkpxTest::listsAndHotspotThatCannotBeKeptAreOneWarningEach()
{
    makeUnwritable(*m_folder);
    const QString warning = QStringLiteral("cannot write ") + m_file;
    const LogRecorder recorder;
    m_control.SetHotspotEnable(1);
    QCOMPARE(recorder.warnings(), QStringList(warning));
    m_control.SetControlConfig({}, {});
    QCOMPARE(recorder.warnings(), QStringList({warning, warning}));
}

void LibvelkkpxTest::rebootAsksTheLoginManager()
{
    const RecordedService logind(QDBusConnection::SystemBus, kLoginManager, answerNothing);
    const LogRecorder recorder;
    m_control.Reboot();

    QCOMPARE(logind.calls().size(), 1);
    const QDBusMessage call = logind.calls().first();
    QCOMPARE(call.path(), QStringLiteral("/org/freedesktop/login1"));
    QCOMPARE(call.interface(), QStringLiteral("org.freedesktop.login1.Manager"));
    QCOMPARE(call.member(), QStringLiteral("Reboot"));
    QCOMPARE(call.arguments(), QVariantList({false}));
    QCOMPARE(recorder.warnings(), QStringList());
}

void LibvelkkpxTest::logoutEndsTheOwnSession()
{
    const RecordedService logind(QDBusConnection::SystemBus, kLoginManager, answerNothing);
    const LogRecorder recorder;
    m_control.Logout();

    QCOMPARE(logind.calls().size(), 1);
    const QDBusMessage call = logind.calls().first();
    QCOMPARE(call.path(), QStringLiteral("/org/freedesktop/login1/session/auto"));
    QCOMPARE(call.interface(), QStringLiteral("org.freedesktop.login1.Session"));
    QCOMPARE(call.member(), QStringLiteral("Terminate"));
    QCOMPARE(call.arguments(), QVariantList());
    QCOMPARE(recorder.warnings(), QStringList());
}

using Action = void (Libvelkkpx::*)();
Q_DECLARE_METATYPE(Action)

void LibvelkkpxTest::callThatFailsIsOneWarning_data()
{
    QTest::addColumn<Action>("act");
    QTest::newRow("Reboot") << &Libvelkkpx::Reboot;
    QTest::newRow("Terminate") << &Libvelkkpx::Logout;
}

void LibvelkkpxTest::callThatFailsIsOneWarning()
{
    QFETCH(Action, act);
    const RecordedService logind(QDBusConnection::SystemBus, kLoginManager, [](const QDBusMessage& call) {
        return call.createErrorReply(QDBusError::AccessDenied, QStringLiteral("not allowed now"));
    });
    const LogRecorder recorder;
    (m_control.*act)();
    QCOMPARE(recorder.warnings(),
             QStringList(QStringLiteral("cannot call %1: not allowed now")
                             .arg(QString::fromUtf8(QTest::currentDataTag()))));
}

void LibvelkkpxTest::absentLoginManagerIsOneWarning()
{
    const LogRecorder recorder;
    m_control.Reboot();
    QCOMPARE(recorder.warnings().size(), 1);
    QVERIFY2(recorder.warnings().first().contains(kLoginManager),
             qUtf8Printable(recorder.warnings().first()));
}

QTEST_GUILESS_MAIN(LibvelkkpxTest)
#include "libvelkkpx_test.moc"
