#include <QTest>

#include "software_report.h"

/// The texts that the platform is sent about software, byte by byte.
class SoftwareReportTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void changeIsReportedToTheLetter()
    {
        SoftwareChange change;
        change.change = 1;
        change.machineId = QStringLiteral("m-1");
        change.ipAddress = QStringLiteral("192.168.1.7");
        change.hardwareAddress = QStringLiteral("F4:0B:00:00:00:01");
        change.name = QStringLiteral("编辑器 %1");
        change.version = QStringLiteral("2.1");
        change.terminalName = QStringLiteral("终端");
        change.time = QDateTime(QDate(2026, 1, 2), QTime(3, 4, 5));
        QCOMPARE(
            softwareChangeReport(change),
            QStringLiteral(R"({"payload":{"mac":"F4:0B:00:00:00:01","machine_id":"m-1",)"
                           R"("operated_at":"2026-01-02 03:04:05","pc_ip":"192.168.1.7","pc_name":"终端",)"
                           R"("software_name":"编辑器 %1","software_version":"2.1","type":1},"type":2002})"));
    }

    void unknownValuesOfAChangeAreEmpty()
    {
        SoftwareChange change;
        change.change = 2;
        change.time = QDateTime(QDate(2026, 12, 31), QTime(23, 59, 59));
        const QString expected =
            QString::fromUtf8(R"({"payload":{"mac":"","machine_id":"","operated_at":"2026-12-31 23:59:59",)"
                              R"("pc_ip":"","pc_name":"","software_name":"","software_version":"","type":2},)"
                              R"("type":2002})");
        QCOMPARE(softwareChangeReport(change), expected);
    }
};

QTEST_GUILESS_MAIN(SoftwareReportTest)
#include "software_report_test.moc"
