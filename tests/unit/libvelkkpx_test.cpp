#include <QDir>
#include <QSettings>
#include <QTemporaryDir>
#include <QtTest>

#include "files.h"
#include "libvelkkpx.h"
#include "log_recorder.h"
#include "recorded_service.h"

namespace {

using SwitchSetter = QString (Libvelkkpx::*)(bool);

const QString kLoginManager = QStringLiteral("org.freedesktop.login1");
const QString kFile = QStringLiteral("norix/desktop-control.ini");

QVariant stored(const QString& path, const QString& key)
{
    return QSettings(path, QSettings::IniFormat).value(QStringLiteral("restrictions/") + key);
}

} // namespace

Q_DECLARE_METATYPE(SwitchSetter)

using Action = void (Libvelkkpx::*)();
Q_DECLARE_METATYPE(Action)

class LibvelkkpxTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_folder = std::make_unique<QTemporaryDir>();
        m_file = m_folder->filePath(kFile);
        qputenv("XDG_CONFIG_HOME", QFile::encodeName(m_folder->path()));
    }

    void switchIsKeptUnderItsName_data()
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

    void switchIsKeptUnderItsName()
    {
        QFETCH(SwitchSetter, set);
        const QByteArray key = QTest::currentDataTag();

        QCOMPARE((m_control.*set)(true), QString());
        QCOMPARE(readBytes(m_file), "[restrictions]\n" + key + "=true\n");
        QCOMPARE((m_control.*set)(false), QString());
        QCOMPARE(readBytes(m_file), "[restrictions]\n" + key + "=false\n");
    }

    void hotspotIsKeptAsNumber()
    {
        m_control.SetHotspotEnable(1);
        QCOMPARE(readBytes(m_file), QByteArray("[restrictions]\nHotspotEnable=1\n"));
        m_control.SetHotspotEnable(0);
        QCOMPARE(readBytes(m_file), QByteArray("[restrictions]\nHotspotEnable=0\n"));
    }

    void controlCenterListsAreKept()
    {
        const QStringList modules = {QStringLiteral("network"), QStringLiteral("账户, all")};
        const QStringList extra = {QStringLiteral("a"), QString(), QStringLiteral("b")};
        m_control.SetControlConfig(modules, extra);
        QCOMPARE(stored(m_file, QStringLiteral("ControlCenterList")).toStringList(), modules);
        QCOMPARE(stored(m_file, QStringLiteral("ControlCenterExtra")).toStringList(), extra);
    }

    void listOfOneEmptyStringStaysOne()
    {
        m_control.SetControlConfig({}, {QString()});
        QCOMPARE(stored(m_file, QStringLiteral("ControlCenterList")).toStringList(), QStringList());
        QCOMPARE(stored(m_file, QStringLiteral("ControlCenterExtra")).toStringList(), QStringList(QString()));
    }

    void fileIsInTheHomeFolderWithoutConfigurationFolder_data()
    {
        QTest::addColumn<bool>("set");
        QTest::newRow("variable not set") << false;
        QTest::newRow("variable empty") << true;
    }

    void fileIsInTheHomeFolderWithoutConfigurationFolder()
    {
        QFETCH(bool, set);
        const QByteArray home = qgetenv("HOME");
        qputenv("HOME", QFile::encodeName(m_folder->path()));
        set ? qputenv("XDG_CONFIG_HOME", "") : qunsetenv("XDG_CONFIG_HOME");

        QCOMPARE(m_control.SetLauncherDisplayable(true), QString());
        qputenv("HOME", home);
        QCOMPARE(stored(m_folder->filePath(QStringLiteral(".config/") + kFile),
                        QStringLiteral("LauncherDisplayable")),
                 QVariant(QStringLiteral("true")));
    }

    void otherContentOfTheFileIsKept()
    {
        QVERIFY(QDir(m_folder->path()).mkdir(QStringLiteral("norix")));
        writeBytes(
            m_file,
            "[look]\ntheme=dark\n\n[restrictions]\nHotspotEnable=0\nLauncherDisplayable=false\nOther=x\n");

        QCOMPARE(m_control.SetLauncherDisplayable(true), QString());
        QCOMPARE(readBytes(m_file),
                 QByteArray("[look]\ntheme=dark\n\n[restrictions]\nHotspotEnable=0\n"
                            "LauncherDisplayable=true\nOther=x\n"));
    }

    void switchThatCannotBeKeptReturnsTheError()
    {
        makeUnwritable();
        const LogRecorder recorder;
        QCOMPARE(m_control.SetLauncherDisplayable(true), QStringLiteral("cannot write ") + m_file);
        QCOMPARE(recorder.warnings(), QStringList());
    }

    void switchIsKeptAlthoughTheFileWasDamaged()
    {
        QVERIFY(QDir(m_folder->path()).mkdir(QStringLiteral("norix")));
        writeBytes(m_file, "not INI at all\n[restrictions]\nOther=x\n");

        QCOMPARE(m_control.SetLauncherDisplayable(true),
                 QStringLiteral("lines that are not INI are lost from ") + m_file);
        QCOMPARE(readBytes(m_file), QByteArray("[restrictions]\nLauncherDisplayable=true\nOther=x\n"));
    }

    void listsAndHotspotThatCannotBeKeptAreOneWarningEach()
    {
        makeUnwritable();
        const QString warning = QStringLiteral("cannot write ") + m_file;
        const LogRecorder recorder;
        m_control.SetHotspotEnable(1);
        QCOMPARE(recorder.warnings(), QStringList(warning));
        m_control.SetControlConfig({}, {});
        QCOMPARE(recorder.warnings(), QStringList({warning, warning}));
    }

    void sessionAndMachineAreEndedByTheLoginManager_data()
    {
        QTest::addColumn<Action>("act");
        QTest::addColumn<QString>("path");
        QTest::addColumn<QString>("interface");
        QTest::addColumn<QVariantList>("arguments");
        QTest::newRow("Reboot") << &Libvelkkpx::Reboot << QStringLiteral("/org/freedesktop/login1")
                                << QStringLiteral("org.freedesktop.login1.Manager") << QVariantList{false};
        QTest::newRow("Terminate") << &Libvelkkpx::Logout
                                   << QStringLiteral("/org/freedesktop/login1/session/auto")
                                   << QStringLiteral("org.freedesktop.login1.Session") << QVariantList();
    }

    void sessionAndMachineAreEndedByTheLoginManager()
    {
        QFETCH(Action, act);
        const RecordedService logind(QDBusConnection::SystemBus, kLoginManager, answerNothing);
        const LogRecorder recorder;
        (m_control.*act)();

        QCOMPARE(logind.calls().size(), 1);
        const QDBusMessage call = logind.calls().first();
        QTEST(call.path(), "path");
        QTEST(call.interface(), "interface");
        QCOMPARE(call.member(), QString::fromUtf8(QTest::currentDataTag()));
        QTEST(call.arguments(), "arguments");
        QCOMPARE(recorder.warnings(), QStringList());
    }

    void callThatFailsIsOneWarning_data()
    {
        QTest::addColumn<Action>("act");
        QTest::newRow("Reboot") << &Libvelkkpx::Reboot;
        QTest::newRow("Terminate") << &Libvelkkpx::Logout;
    }

    void callThatFailsIsOneWarning()
    {
        QFETCH(Action, act);
        const RecordedService logind(QDBusConnection::SystemBus, kLoginManager,
                                     answerError(QDBusError::errorString(QDBusError::AccessDenied),
                                                 QStringLiteral("not allowed now")));
        const LogRecorder recorder;
        (m_control.*act)();
        QCOMPARE(recorder.warnings(),
                 QStringList(QStringLiteral("cannot call %1: not allowed now")
                                 .arg(QString::fromUtf8(QTest::currentDataTag()))));
    }

    void absentLoginManagerIsOneWarning()
    {
        const LogRecorder recorder;
        m_control.Reboot();
        QCOMPARE(recorder.warnings().size(), 1);
        QVERIFY2(recorder.warnings().first().contains(kLoginManager),
                 qUtf8Printable(recorder.warnings().first()));
    }

private:
    /// A file where the folder should be stops every user, root included.
    void makeUnwritable() { writeBytes(m_folder->filePath(QStringLiteral("norix")), {}); }

    std::unique_ptr<QTemporaryDir> m_folder;
    QString m_file;
    Libvelkkpx m_control;
};

QTEST_GUILESS_MAIN(LibvelkkpxTest)
#include "libvelkkpx_test.moc"
