#include <QtTest>

#include "filecontent.h"
#include "files.h"
#include "information_files.h"
#include "log_recorder.h"

using velk::base::FileContent;

using FileChange = void (*)();
Q_DECLARE_METATYPE(FileChange)

class FileContentMachineIdTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        // Before anything else was read.
        removeAny(kMachineId);
        const LogRecorder log;
        bool ok = true;
        QVERIFY(m_content->getMachineID(&ok, false).isNull());
        QVERIFY(!ok);
    }

    void init()
    {
        removeAny(kMachineId);
        writeBytes(kMachineId, "");
        m_content->getMachineID(nullptr, true); // nothing is kept
    }

    void thereIsOneInstance()
    {
        QCOMPARE(FileContent::instace(), m_content);
        QCOMPARE(m_content->parent(), nullptr);
        QCOMPARE(m_content->metaObject()->className(), "velk::base::FileContent");
    }

    void identifierIsTheTrimmedText_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<QString>("identifier");

        QTest::newRow("line") << QByteArray("id-1\n") << QStringLiteral("id-1");
        QTest::newRow("white space around") << QByteArray(" \t\r\n id-1 \v\f\n\n") << QStringLiteral("id-1");
        QTest::newRow("white space inside") << QByteArray("id 1\nid 2") << QStringLiteral("id 1\nid 2");
        QTest::newRow("UTF-8") << QByteArray("终端-1") << QStringLiteral("终端-1");
        QTest::newRow("no UTF-8") << QByteArray("id\xff") << QStringLiteral("id\uFFFD");
        QTest::newRow("NUL inside") << QByteArray("id-1\0rest", 9) << QStringLiteral("id-1");
        QTest::newRow("white space before NUL") << QByteArray("id-1 \0rest", 10) << QStringLiteral("id-1 ");
        QTest::newRow("NUL first") << QByteArray("\0rest", 5) << QString();
        QTest::newRow("huge") << QByteArray(50'000'000, 'a') << QString(50'000'000, QLatin1Char('a'));
    }

    void identifierIsTheTrimmedText()
    {
        QFETCH(QByteArray, bytes);
        QFETCH(QString, identifier);
        writeBytes(kMachineId, bytes);
        const LogRecorder log;
        bool ok = false;
        const QString found = m_content->getMachineID(&ok, false);
        QVERIFY(found == identifier);
        QVERIFY(ok);
        QCOMPARE(log.lines(), QStringList());
    }

    void blankFileGivesNullIdentifierThatIsNotKept_data()
    {
        QTest::addColumn<QByteArray>("blank");
        QTest::newRow("empty") << QByteArray("");
        QTest::newRow("white space") << QByteArray(" \n\t \r\n");
    }

    void blankFileGivesNullIdentifierThatIsNotKept()
    {
        QFETCH(QByteArray, blank);
        writeBytes(kMachineId, blank);
        bool ok = false;
        QVERIFY(m_content->getMachineID(&ok, false).isNull());
        QVERIFY(ok);

        writeBytes(kMachineId, "id-2");
        QCOMPARE(m_content->getMachineID(&ok, false), QStringLiteral("id-2"));
    }

    void identifierIsReadOnce()
    {
        writeBytes(kMachineId, "id-1");
        m_content->getMachineID(nullptr, false);
        removeAny(kMachineId);

        const LogRecorder log;
        bool ok = false;
        QCOMPARE(m_content->getMachineID(&ok, false), QStringLiteral("id-1"));
        QVERIFY(ok);
        QCOMPARE(log.lines(), QStringList());
    }

    void reloadReadsAgain()
    {
        writeBytes(kMachineId, "id-1");
        m_content->getMachineID(nullptr, false);
        writeBytes(kMachineId, "id-2");
        bool ok = false;
        QCOMPARE(m_content->getMachineID(&ok, true), QStringLiteral("id-2"));
        QVERIFY(ok);
        QCOMPARE(m_content->getMachineID(nullptr, false), QStringLiteral("id-2"));

        writeBytes(kMachineId, "\n");
        QVERIFY(m_content->getMachineID(&ok, true).isNull());
        QVERIFY(ok);
    }

    void unopenableFileLeavesWhatWasKept_data()
    {
        QTest::addColumn<FileChange>("spoil");
        QTest::addColumn<bool>("exists");

        const auto row = [](const char* name, bool exists, FileChange spoil) {
            QTest::newRow(name) << spoil << exists;
        };
        row("missing", false, [] { removeAny(kMachineId); });
        row("unreadable", true, [] { setPermissions(kMachineId, kNoAccess); });
        row("folder", true, [] {
            removeAny(kMachineId);
            QDir().mkdir(kMachineId);
        });
    }

    void unopenableFileLeavesWhatWasKept()
    {
        QFETCH(FileChange, spoil);
        QFETCH(bool, exists);
        writeBytes(kMachineId, "id-1");
        m_content->getMachineID(nullptr, false);
        spoil();

        const LogRecorder log;
        bool ok = true;
        QCOMPARE(m_content->getMachineID(&ok, true), QStringLiteral("id-1"));
        QVERIFY(!ok);
        const QStringList expected{openFailure(kMachineId, kReadMode, exists),
                                   operationFailure("getMachineID")};
        QCOMPARE(log.lines(), expected);
    }

    void withoutFileThereIsNoIdentifier()
    {
        removeAny(kMachineId);
        const LogRecorder log;
        bool ok = true;
        QCOMPARE(m_content->getMachineID(&ok, false), QString());
        QVERIFY(!ok);
    }

    void resultFlagMayBeLeftOut()
    {
        writeBytes(kMachineId, "id-1");
        QCOMPARE(m_content->getMachineID(), QStringLiteral("id-1")); // reads
        QCOMPARE(m_content->getMachineID(), QStringLiteral("id-1")); // from the cache
        removeAny(kMachineId);
        const LogRecorder log;
        QCOMPARE(m_content->getMachineID(nullptr, true), QStringLiteral("id-1")); // fails
    }

    void noHandleStaysOpen()
    {
        writeBytes(kMachineId, "id-1");
        m_content->getMachineID();
        QCOMPARE(openHandles(kMachineId), 0);
    }

private:
    FileContent* m_content = FileContent::instace();
};

QTEST_GUILESS_MAIN(FileContentMachineIdTest)
#include "filecontent_machine_id_test.moc"
