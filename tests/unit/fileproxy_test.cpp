#include <QTemporaryDir>
#include <QtTest>

#include <memory>
#include <optional>

#include "fileproxy.h"
#include "files.h"
#include "information_files.h"
#include "log_recorder.h"

using velk::base::FileProxy;

Q_DECLARE_METATYPE(QIODevice::OpenMode)
Q_DECLARE_METATYPE(std::optional<QFile::Permissions>)

class FileProxyTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init() { removeAny(m_path); }

    void openedFileIsReadSilently()
    {
        writeBytes(m_path,
                   "some\0bytes\r\n"
                   "\xff");
        const LogRecorder log;
        FileProxy proxy;
        QVERIFY(proxy.open(m_path, QIODevice::ReadOnly));
        QCOMPARE(proxy.readAll(), readBytes(m_path));
        QCOMPARE(log.lines(), QStringList());
    }

    void failedOpenIsLoggedWithItsCause_data()
    {
        QTest::addColumn<std::optional<QFile::Permissions>>("permissions");
        QTest::addColumn<QIODevice::OpenMode>("mode");
        QTest::addColumn<QString>("shownMode");

        const auto row = [](const char* name, std::optional<QFile::Permissions> permissions,
                            QIODevice::OpenMode mode, const QString& shownMode) {
            QTest::newRow(name) << permissions << mode << shownMode;
        };
        row("read missing", {}, QIODevice::ReadOnly, kReadMode);
        row("read unreadable", kNoAccess, QIODevice::ReadOnly, kReadMode);
        row("write unwritable", kNoAccess, QIODevice::WriteOnly, kWriteMode);
        row("several flags", kNoAccess, QIODevice::WriteOnly | QIODevice::Truncate,
            QStringLiteral("Truncate|WriteOnly"));
    }

    void failedOpenIsLoggedWithItsCause()
    {
        QFETCH(std::optional<QFile::Permissions>, permissions);
        QFETCH(QIODevice::OpenMode, mode);
        QFETCH(QString, shownMode);
        if (permissions) {
            writeBytes(m_path, "kept");
            setPermissions(m_path, *permissions);
        }

        const LogRecorder log;
        FileProxy proxy;
        QVERIFY(!proxy.open(m_path, mode));
        QCOMPARE(log.lines(), QStringList(openFailure(m_path, shownMode, permissions.has_value())));
        QCOMPARE(readBytes(m_path), permissions ? QByteArray("kept") : QByteArray());
    }

    void folderIsNoFile()
    {
        const LogRecorder log;
        FileProxy proxy;
        QVERIFY(!proxy.open(m_folder.path(), QIODevice::ReadOnly));
        QVERIFY(log.lines().join(QChar()).endsWith(QLatin1String(", exist: true")));
    }

    void reopeningClosesFirstHandle()
    {
        writeBytes(m_path, "text");
        const LogRecorder log;
        FileProxy proxy;
        QVERIFY(proxy.open(m_path, QIODevice::ReadOnly));
        QCOMPARE(openHandles(m_path), 1);
        QVERIFY(proxy.open(m_path, QIODevice::WriteOnly));
        QCOMPARE(log.lines(), QStringList()); // Qt warns of a handle that is still open
        QCOMPARE(openHandles(m_path), 1);
        QCOMPARE(proxy.write("new"), 3);
        QCOMPARE(readBytes(m_path), QByteArray("new"));
    }

    void failedReopeningClosesFirstHandle()
    {
        writeBytes(m_path, "text");
        const LogRecorder log;
        FileProxy proxy;
        QVERIFY(proxy.open(m_path, QIODevice::ReadOnly));
        QVERIFY(!proxy.open(m_path + QStringLiteral(".missing"), QIODevice::ReadOnly));
        QCOMPARE(openHandles(m_path), 0);
    }

    void destructionClosesFile()
    {
        writeBytes(m_path, "text");
        {
            FileProxy proxy;
            QVERIFY(proxy.open(m_path, QIODevice::ReadOnly));
            QCOMPARE(openHandles(m_path), 1);
        }
        QCOMPARE(openHandles(m_path), 0);
    }

    void writingEmptiesFileFirst()
    {
        writeBytes(m_path, "a longer text");
        FileProxy proxy;
        QVERIFY(proxy.open(m_path, QIODevice::WriteOnly));
        QCOMPARE(readBytes(m_path), QByteArray(""));
    }

    void writeReturnsHowMuchReachedFile_data()
    {
        QTest::addColumn<int>("room");
        QTest::addColumn<qint64>("written");
        QTest::newRow("no room") << 0 << qint64(-1);
        QTest::newRow("room for a part") << 4 << qint64(4);
        QTest::newRow("room for all") << 10 << qint64(10);
    }

    void writeReturnsHowMuchReachedFile()
    {
        QFETCH(int, room);
        QFETCH(qint64, written);
        FileProxy proxy;
        QVERIFY(proxy.open(m_path, QIODevice::WriteOnly));
        const FileSizeLimit limit(static_cast<rlim_t>(room));
        QCOMPARE(proxy.write("0123456789"), written);
    }

    void fullDeviceTakesNothing()
    {
        FileProxy proxy;
        QVERIFY(proxy.open(QStringLiteral("/dev/full"), QIODevice::WriteOnly));
        QCOMPARE(proxy.write("text"), qint64(-1));
    }

    void unopenedProxyReadsAndWritesNothing()
    {
        const LogRecorder log;
        FileProxy proxy;
        QCOMPARE(proxy.readAll(), QByteArray());
        QCOMPARE(proxy.write("text"), qint64(-1));
    }

    void parentOwnsProxy()
    {
        writeBytes(m_path, "text");
        auto parent = std::make_unique<QObject>();
        auto* proxy = new FileProxy(parent.get());
        QVERIFY(proxy->open(m_path, QIODevice::ReadOnly));
        QCOMPARE(proxy->metaObject()->className(), "velk::base::FileProxy");
        parent.reset();
        QCOMPARE(openHandles(m_path), 0);
    }

private:
    QTemporaryDir m_folder;
    QString m_path = m_folder.filePath(QStringLiteral("file"));
};

QTEST_GUILESS_MAIN(FileProxyTest)
#include "fileproxy_test.moc"
