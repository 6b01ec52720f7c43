#include <QTemporaryDir>
#include <QTextCodec>
#include <QtTest>

#include "file_manager.h"
#include "files.h"
#include "log_recorder.h"

Q_DECLARE_METATYPE(QIODevice::OpenMode)

namespace {

const QString kWriteLine = QStringLiteral("info: FileManager::writeFile--###############----- ");

} // namespace

class FileManagerTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init() { removeAny(m_path); }

    void thereIsOneManager()
    {
        QCOMPARE(FileManager::GetInstance(), m_manager);
        QCOMPARE(m_manager->parent(), nullptr);
        QCOMPARE(m_manager->metaObject()->className(), "FileManager");
    }

    void textIsReadAsUtf8UpToTheFirstNul_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<QString>("text");

        QTest::newRow("empty") << QByteArray("") << QString();
        QTest::newRow("lines") << QByteArray("a\nb\n\n") << QStringLiteral("a\nb\n\n");
        QTest::newRow("lines of Windows") << QByteArray("a\r\nb\r\n") << QStringLiteral("a\nb\n");
        QTest::newRow("Chinese") << QByteArray("应用 一") << QStringLiteral("应用 一");
        QTest::newRow("byte order mark") << QByteArray("\xef\xbb\xbf"
                                                       "a")
                                         << QStringLiteral("a");
        QTest::newRow("no UTF-8") << QByteArray("a\xff"
                                                "b")
                                  << QStringLiteral("a\uFFFDb");
        QTest::newRow("NUL inside") << QByteArray("before\0after", 12) << QStringLiteral("before");
        QTest::newRow("NUL first") << QByteArray("\0after", 6) << QString();
    }

    void textIsReadAsUtf8UpToTheFirstNul()
    {
        QFETCH(QByteArray, bytes);
        writeBytes(m_path, bytes);
        const LogRecorder log;
        QTEST(m_manager->readFile(m_path), "text");
        QCOMPARE(log.lines(), QStringList());
    }

    void unopenableFileReadsAsEmptyWithWarning_data()
    {
        QTest::addColumn<QString>("path");
        const QString locked = m_folder.filePath(QStringLiteral("locked"));
        writeBytes(locked, "text");
        setPermissions(locked, kNoAccess);

        QTest::newRow("missing") << m_path;
        QTest::newRow("unreadable") << locked;
        QTest::newRow("folder") << m_folder.path();
    }

    void unopenableFileReadsAsEmptyWithWarning()
    {
        QFETCH(QString, path);
        const LogRecorder log;
        QCOMPARE(m_manager->readFile(path), QString());
        QCOMPARE(
            log.lines(),
            QStringList(QStringLiteral("warning: File open error--#33333333333------ \"%1\"").arg(path)));
    }

    void hugeFileIsReadWhole()
    {
        const QByteArray line("0123456789abcdef用\n");
        const int count = 50'000'000 / line.size();
        writeBytes(m_path, line.repeated(count));
        const QString text = m_manager->readFile(m_path);
        QCOMPARE(text.size(), QString::fromUtf8(line).size() * count);
        QVERIFY(text.endsWith(QString::fromUtf8(line)));
    }

    void readingLeavesNoHandle()
    {
        writeBytes(m_path, "text");
        m_manager->readFile(m_path);
        QCOMPARE(openHandles(m_path), 0);
    }

    void writingIsLogged()
    {
        const LogRecorder log;
        QVERIFY(m_manager->writeFile(m_path, QStringLiteral("a text"), QIODevice::WriteOnly));
        const QStringList expected{kWriteLine + QStringLiteral(R"("%1" : "a text")").arg(m_path),
                                   kWriteLine + QStringLiteral(R"("%1")").arg(m_folder.path())};
        QCOMPARE(log.lines(), expected);
        QCOMPARE(openHandles(m_path), 0);
    }

    void modeSaysWhatBecomesOfTheOldText_data()
    {
        QTest::addColumn<QIODevice::OpenMode>("mode");
        QTest::addColumn<QByteArray>("content");

        const auto row = [](const char* name, QIODevice::OpenMode mode, const char* content) {
            QTest::newRow(name) << mode << QByteArray(content);
        };
        row("replace", QIODevice::WriteOnly, "新\n");
        row("replace text", QIODevice::WriteOnly | QIODevice::Text, "新\n");
        row("append", QIODevice::Append, "old text新\n");
        row("append text", QIODevice::Append | QIODevice::Text, "old text新\n");
        row("only a new file", QIODevice::WriteOnly | QIODevice::NewOnly, "old text");
        row("read only", QIODevice::ReadOnly, "old text");
    }

    void modeSaysWhatBecomesOfTheOldText()
    {
        QFETCH(QIODevice::OpenMode, mode);
        writeBytes(m_path, "old text");
        const LogRecorder log;
        QVERIFY(m_manager->writeFile(m_path, QStringLiteral("新\n"), mode));
        QTEST(readBytes(m_path), "content");
    }

    void folderChainIsCreated()
    {
        const LogRecorder log;
        const QString path = m_folder.filePath(QStringLiteral("one/two/three/file"));
        QVERIFY(m_manager->writeFile(path, QStringLiteral("text"), QIODevice::WriteOnly));
        QCOMPARE(readBytes(path), QByteArray("text"));
        QCOMPARE(log.lines().size(), 2);
    }

    void folderOfRelativePathIsAbsolute()
    {
        const QString before = QDir::currentPath();
        QVERIFY(QDir::setCurrent(m_folder.path()));
        const LogRecorder log;
        m_manager->writeFile(QStringLiteral("list"), QString(), QIODevice::WriteOnly);
        QDir::setCurrent(before);
        QCOMPARE(log.lines().value(1), kWriteLine + QStringLiteral(R"("%1")").arg(m_folder.path()));
        QVERIFY(QFile::exists(m_path));
    }

    void uncreatableFolderIsLoggedAndCountsAsWritten()
    {
        writeBytes(m_path, "a file in the folder's place");
        const LogRecorder log;
        QVERIFY(m_manager->writeFile(m_path + QStringLiteral("/sub/file"), QStringLiteral("text"),
                                     QIODevice::WriteOnly));
        QCOMPARE(log.lines().value(2), QStringLiteral(R"(info: mkpath error: "%1/sub")").arg(m_path));
        QCOMPARE(log.lines().size(), 3);
        QCOMPARE(readBytes(m_path), QByteArray("a file in the folder's place"));
    }

    void unwritableFileCountsAsWritten()
    {
        writeBytes(m_path, "kept");
        setPermissions(m_path, kNoAccess);
        const LogRecorder log;
        QVERIFY(m_manager->writeFile(m_path, QStringLiteral("text"), QIODevice::WriteOnly));
        QCOMPARE(readBytes(m_path), QByteArray("kept"));
    }

    void fullDeviceCountsAsWritten()
    {
        const LogRecorder log;
        QVERIFY(m_manager->writeFile(QStringLiteral("/dev/full"), QString(100'000, QLatin1Char('a')),
                                     QIODevice::WriteOnly));
    }

    void textIsWrittenInTheEncodingOfTheLocale()
    {
        auto* const before = QTextCodec::codecForLocale();
        QTextCodec::setCodecForLocale(QTextCodec::codecForName("GB18030"));
        const LogRecorder log;
        m_manager->writeFile(m_path, QStringLiteral("应用"), QIODevice::WriteOnly);
        QTextCodec::setCodecForLocale(before);
        QCOMPARE(readBytes(m_path), QByteArray("\xd3\xa6\xd3\xc3"));
    }

private:
    FileManager* m_manager = FileManager::GetInstance();
    QTemporaryDir m_folder;
    QString m_path = m_folder.filePath(QStringLiteral("list"));
};

QTEST_GUILESS_MAIN(FileManagerTest)
#include "file_manager_test.moc"
