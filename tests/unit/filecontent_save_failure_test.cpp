#include <QtTest>

#include <optional>

#include "filecontent.h"
#include "files.h"
#include "information_files.h"
#include "log_recorder.h"

using velk::base::FileContent;
using velk::base::updateUserInfo;

using Operation = bool (*)();
Q_DECLARE_METATYPE(Operation)
Q_DECLARE_METATYPE(std::optional<QFile::Permissions>)

namespace {

bool saveDomain()
{
    return FileContent::saveDomain(true);
}

bool update()
{
    return updateUserInfo(QStringLiteral("terminal_name"), QStringLiteral("new"));
}

bool saveRecord()
{
    return FileContent::saveUserInfo(velk::base::UserInfo());
}

void addOperations()
{
    QTest::addColumn<Operation>("operation");
    QTest::addColumn<QString>("failure");
    QTest::newRow("saveDomain") << &saveDomain
                                << QStringLiteral(R"(info: write value failed, key: "is_Domain")");
    QTest::newRow("updateUserInfo") << &update
                                    << QStringLiteral(R"(info: write value failed, key: "terminal_name")");
    QTest::newRow("saveUserInfo") << &saveRecord << QStringLiteral("info: write info json failed");
}

const QByteArray kBefore = R"({"is_Domain":false,"server_ip":"10.0.0.1"})";

} // namespace

/// The operations that write, where the file or the disk does not let them.
class FileContentSaveFailureTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init() { removeAny(kUserInfo); }

    void unusableFileStaysAsItIs_data()
    {
        QTest::addColumn<Operation>("operation");
        QTest::addColumn<std::optional<QFile::Permissions>>("permissions");
        QTest::addColumn<QString>("failingMode");

        const std::optional<QFile::Permissions> missing;
        const std::optional<QFile::Permissions> locked{kNoAccess};
        const std::optional<QFile::Permissions> readable{QFile::ReadOwner};
        const std::optional<QFile::Permissions> writable{QFile::WriteOwner};

        QTest::newRow("saveDomain, missing") << &saveDomain << missing << kReadMode;
        QTest::newRow("saveDomain, locked") << &saveDomain << locked << kReadMode;
        QTest::newRow("saveDomain, unreadable") << &saveDomain << writable << kReadMode;
        QTest::newRow("saveDomain, unwritable") << &saveDomain << readable << kWriteMode;
        QTest::newRow("updateUserInfo, missing") << &update << missing << kReadMode;
        QTest::newRow("updateUserInfo, locked") << &update << locked << kReadMode;
        QTest::newRow("updateUserInfo, unreadable") << &update << writable << kReadMode;
        QTest::newRow("updateUserInfo, unwritable")
            << &update << readable << QStringLiteral("Truncate|WriteOnly");
        QTest::newRow("saveUserInfo, locked") << &saveRecord << locked << kWriteMode;
        QTest::newRow("saveUserInfo, unwritable") << &saveRecord << readable << kWriteMode;
    }

    void unusableFileStaysAsItIs()
    {
        QFETCH(Operation, operation);
        QFETCH(std::optional<QFile::Permissions>, permissions);
        QFETCH(QString, failingMode);
        if (permissions) {
            writeBytes(kUserInfo, kBefore);
            setPermissions(kUserInfo, *permissions);
        }
        const QString name = QString::fromLatin1(QTest::currentDataTag()).section(QLatin1Char(','), 0, 0);

        const LogRecorder log;
        QVERIFY(!operation());
        const QStringList expected{openFailure(kUserInfo, failingMode, permissions.has_value()),
                                   operationFailure(qPrintable(name))};
        QCOMPARE(log.lines(), expected);
        QCOMPARE(readBytes(kUserInfo), permissions ? kBefore : QByteArray());
    }

    void unchangedMembershipNeedsNoWritableFile()
    {
        writeBytes(kUserInfo, R"({"is_Domain":true})");
        setPermissions(kUserInfo, QFile::ReadOwner);
        const LogRecorder log;
        QVERIFY(saveDomain());
    }

    void recordNeedsNoReadableFile()
    {
        writeBytes(kUserInfo, kBefore);
        setPermissions(kUserInfo, QFile::WriteOwner);
        QVERIFY(saveRecord());
        QVERIFY(readBytes(kUserInfo).contains("terminal_name"));
    }

    void fullDiskIsLogged_data() { addOperations(); }

    void fullDiskIsLogged()
    {
        QFETCH(Operation, operation);
        QFETCH(QString, failure);
        writeBytes(kUserInfo, kBefore);
        const FileSizeLimit limit(0);
        const LogRecorder log;
        QVERIFY(!operation());
        QCOMPARE(log.lines(), QStringList(failure));
    }

    void firstByteMakesAWriteGood_data() { addOperations(); }

    void firstByteMakesAWriteGood()
    {
        QFETCH(Operation, operation);
        writeBytes(kUserInfo, kBefore);
        const FileSizeLimit limit(1);
        const LogRecorder log;
        QVERIFY(operation());
        QCOMPARE(readBytes(kUserInfo), QByteArray("{"));
        QCOMPARE(log.lines(), QStringList());
    }

    void noHandleStaysOpen_data() { addOperations(); }

    void noHandleStaysOpen()
    {
        QFETCH(Operation, operation);
        writeBytes(kUserInfo, kBefore);
        QVERIFY(operation());
        QCOMPARE(openHandles(kUserInfo), 0);
    }
};

QTEST_GUILESS_MAIN(FileContentSaveFailureTest)
#include "filecontent_save_failure_test.moc"
