#include <QtTest>

#include "filecontent.h"
#include "files.h"
#include "information_files.h"
#include "log_recorder.h"

using velk::base::FileContent;
using velk::base::updateUserInfo;
using velk::base::UserInfo;

/// What the operations that write leave in the file, byte for byte.
class FileContentSaveTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init();

    void domainMembershipIsSaved_data();
    void domainMembershipIsSaved();
    void saveDomainNeedsAReadableAndWritableFile_data();
    void saveDomainNeedsAReadableAndWritableFile();
    void unchangedMembershipNeedsNoWritableFile();
    void valueIsUpdated_data();
    void valueIsUpdated();
    void updateNeedsAReadableAndWritableFile_data();
    void updateNeedsAReadableAndWritableFile();
    void recordReplacesFile();
    void recordCreatesFile();
    void recordNeedsAWritableFile_data();
    void recordNeedsAWritableFile();
    void fullDiskFailsEveryWrite();
    void firstByteMakesAWriteGood();
    void noHandleStaysOpen();

private:
    static void addObstacles();
};

namespace {

const QString kName = QStringLiteral("terminal_name");

void noObstacle(const QByteArray& content)
{
    writeBytes(kUserInfo, content);
}

} // namespace

void FileContentSaveTest::init()
{
    removeAny(kUserInfo);
}

void FileContentSaveTest::domainMembershipIsSaved_data()
{
    QTest::addColumn<QByteArray>("before");
    QTest::addColumn<bool>("value");
    QTest::addColumn<bool>("result");
    QTest::addColumn<QByteArray>("after");
    QTest::addColumn<QString>("line");

    const auto changed = [](const char* name, const char* before, bool value, const char* after) {
        QTest::newRow(name) << QByteArray(before) << value << true << QByteArray(after) << QString();
    };
    const auto same = [](const char* name, const char* before, bool value) {
        QTest::newRow(name) << QByteArray(before) << value << true << QByteArray(before)
                            << QStringLiteral(R"(debug: value is the same in file, key: "is_Domain")");
    };
    const auto refused = [](const char* name, const char* before) {
        QTest::newRow(name) << QByteArray(before) << true << false << QByteArray(before)
                            << QStringLiteral(R"(info: It is not contain in info file, key: "is_Domain")");
    };
    const char* const isTrue = "{\n    \"is_Domain\": true\n}\n";
    const char* const isFalse = "{\n    \"is_Domain\": false\n}\n";

    changed("to true", R"({"is_Domain":false})", true, isTrue);
    changed("to false", R"({"is_Domain":true})", false, isFalse);
    changed("text is no true", R"({"is_Domain":"true"})", true, isTrue);
    changed("number is no true", R"({"is_Domain":1})", true, isTrue);
    changed("byte order mark goes", "\xef\xbb\xbf{\"is_Domain\":true}", false, isFalse);
    changed("other keys stay", R"({"z":{"a":[1,"终"]},"is_Domain":true,"server_ip":""})", false, R"({
    "is_Domain": false,
    "server_ip": "",
    "z": {
        "a": [
            1,
            "终"
        ]
    }
}
)");
    same("still true", R"( {"is_Domain":true} )", true);
    same("still false", R"({"is_Domain":false})", false);
    same("text counts as false", R"({"is_Domain":"true"})", false);
    same("null counts as false", R"({"is_Domain":null})", false);
    refused("no such key", R"({"server_host":"s"})");
    refused("other letter case", R"({"is_domain":false})");
    refused("no JSON", "is_Domain=false");
    refused("array", R"([{"is_Domain":false}])");
    refused("empty", "");
}

void FileContentSaveTest::domainMembershipIsSaved()
{
    QFETCH(QByteArray, before);
    QFETCH(bool, value);
    QFETCH(QString, line);
    writeBytes(kUserInfo, before);
    const LogRecorder log;
    QTEST(FileContent::saveDomain(value), "result");
    QTEST(readBytes(kUserInfo), "after");
    QCOMPARE(log.lines(), line.isEmpty() ? QStringList() : QStringList(line));
}

/// What keeps a file from being read or written, and the mode whose failure is logged (at %1 the mode of
/// the operation's own write).
void FileContentSaveTest::addObstacles()
{
    QTest::addColumn<bool>("present");
    QTest::addColumn<QFile::Permissions>("permissions");
    QTest::addColumn<bool>("readFails");

    QTest::newRow("missing") << false << kReadWrite << true;
    QTest::newRow("unreadable and unwritable") << true << kNoAccess << true;
    QTest::newRow("unreadable, writable") << true << QFile::Permissions(QFile::WriteOwner) << true;
    QTest::newRow("readable, unwritable") << true << QFile::Permissions(QFile::ReadOwner) << false;
}
