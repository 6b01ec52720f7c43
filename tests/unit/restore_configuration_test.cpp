#include <QFile>
#include <QTemporaryDir>
#include <QtTest>

#include "files.h"
#include "libvelkkpx.h"
#include "log_recorder.h"
#include "message_transfer.h"

namespace {

const QString kBackup = QStringLiteral("/etc/velk/config.ini");

QString recordPath;

/// Appends a step to the record; every setter returns an error's text, which the caller must ignore.
QString record(const QString& step)
{
    QFile file(recordPath);
    if (file.open(QIODevice::Append)) {
        file.write(step.toUtf8() + '\n');
    }
    return QStringLiteral("cannot do it");
}

QString recordSwitch(const char* setter, bool value)
{
    return record(QString::fromLatin1(setter) + (value ? QLatin1String(" true") : QLatin1String(" false")));
}

QString quoted(const QStringList& list)
{
    QString text;
    QDebug(&text).nospace() << list;
    return text;
}

} // namespace

// These replace the library's functions by ones that only record the order of the calls.
void Libvelkkpx::SetControlConfig(const QStringList& modules, const QStringList& extra)
{
    record(QStringLiteral("SetControlConfig %1 %2").arg(quoted(modules), quoted(extra)));
}

void Libvelkkpx::SetHotspotEnable(int enable)
{
    record(QStringLiteral("SetHotspotEnable %1").arg(enable));
}

QString Libvelkkpx::SetShortcutKeyEnable(bool enable)
{
    return recordSwitch("SetShortcutKeyEnable", enable);
}

QString Libvelkkpx::SetLauncherDisplayable(bool displayable)
{
    return recordSwitch("SetLauncherDisplayable", displayable);
}

QString Libvelkkpx::SetTaskbarRightclickMenuEnable(bool enable)
{
    return recordSwitch("SetTaskbarRightclickMenuEnable", enable);
}

QString Libvelkkpx::SetResidentTaskbarAppDisplayable(bool displayable)
{
    return recordSwitch("SetResidentTaskbarAppDisplayable", displayable);
}

QString Libvelkkpx::SetRecycleBinDisplayable(bool displayable)
{
    return recordSwitch("SetRecycleBinDisplayable", displayable);
}

QString Libvelkkpx::SetWebTrayIconClickable(bool clickable)
{
    return recordSwitch("SetWebTrayIconClickable", clickable);
}

QString Libvelkkpx::SetUsbTrayIconClickable(bool clickable)
{
    return recordSwitch("SetUsbTrayIconClickable", clickable);
}

void Libvelkkpx::Reboot()
{
    record(QStringLiteral("Reboot"));
}

void Libvelkkpx::Logout()
{
    record(QStringLiteral("Logout"));
}

/// What the desktop-control library and systemctl are asked for, in which order.
class RestoreConfigurationTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        recordPath = m_folder.filePath(QStringLiteral("record"));
        const QString systemctl = m_folder.filePath(QStringLiteral("systemctl"));
        writeBytes(systemctl,
                   "#!/bin/sh\necho systemctl \"$@\" >>" + QFile::encodeName(recordPath) + "\nexit 1\n");
        QVERIFY(QFile::setPermissions(systemctl, QFile::ReadOwner | QFile::ExeOwner));
        qputenv("PATH", QFile::encodeName(m_folder.path()) + ':' + qgetenv("PATH"));
    }

    void init()
    {
        writeBytes(kBackup, "[config]\nControlCenterList=network, display\n");
        QFile::remove(recordPath);
    }

    void stepsComeInTheirOrderAndSilentlyWhateverFails()
    {
        const QStringList expected{QStringLiteral(R"(SetControlConfig ("network", "display") (""))"),
                                   QStringLiteral("SetHotspotEnable 1"),
                                   QStringLiteral("SetShortcutKeyEnable true"),
                                   QStringLiteral("SetLauncherDisplayable true"),
                                   QStringLiteral("SetTaskbarRightclickMenuEnable true"),
                                   QStringLiteral("SetResidentTaskbarAppDisplayable true"),
                                   QStringLiteral("SetRecycleBinDisplayable true"),
                                   QStringLiteral("SetWebTrayIconClickable true"),
                                   QStringLiteral("SetUsbTrayIconClickable true"),
                                   QStringLiteral("systemctl --global stop prys")};
        const LogRecorder log;
        QCOMPARE(restore(), expected);
        QCOMPARE(log.lines(), QStringList());
    }

    void moduleListIsTheBackedUpOne_data()
    {
        QTest::addColumn<QByteArray>("backup");
        QTest::addColumn<QString>("list");

        QTest::newRow("one module") << QByteArray("[config]\nControlCenterList=network\n")
                                    << QStringLiteral(R"(("network"))");
        QTest::newRow("no such key") << QByteArray("[config]\nOther=a, b\n") << QStringLiteral("()");
        QTest::newRow("other group") << QByteArray("[other]\nControlCenterList=a, b\n")
                                     << QStringLiteral("()");
        QTest::newRow("no group") << QByteArray("ControlCenterList=a, b\n") << QStringLiteral("()");
        QTest::newRow("no INI file") << QByteArray("not at all\n") << QStringLiteral("()");
    }

    void moduleListIsTheBackedUpOne()
    {
        QFETCH(QByteArray, backup);
        QFETCH(QString, list);
        writeBytes(kBackup, backup);
        QCOMPARE(restore().value(0), QStringLiteral("SetControlConfig %1 (\"\")").arg(list));
    }

private:
    QStringList restore()
    {
        m_transfer.restoreConfiguration();
        return QString::fromUtf8(readBytes(recordPath)).split(QLatin1Char('\n'), Qt::SkipEmptyParts);
    }

    QTemporaryDir m_folder;
    MessageTransfer m_transfer;
};

QTEST_GUILESS_MAIN(RestoreConfigurationTest)
#include "restore_configuration_test.moc"
