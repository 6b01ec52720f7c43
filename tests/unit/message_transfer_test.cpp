#include <QJsonDocument>
#include <QtTest>

#include <algorithm>
#include <memory>

#include "constants.h"
#include "message_transfer.h"
#include "pretended.h"
#include "recorded_service.h"

namespace {

/// The forced actions that the login manager was asked for.
QStringList forcedActions(const RecordedService& logind)
{
    QStringList members;
    const auto calls = logind.calls();
    for (const QDBusMessage& call : calls) {
        members << call.member();
    }
    return members.filter(QRegularExpression(QStringLiteral("Reboot|Terminate")));
}

/// Whether a countdown of exactly a minute runs: by default Qt lets a timer of this length fire half a second
/// early.
bool isCountingDown(const MessageTransfer& transfer)
{
    const auto timers = transfer.findChildren<QTimer*>();
    return std::any_of(timers.begin(), timers.end(), [](const QTimer* timer) {
        return timer->isActive() && timer->interval() == 60000 && timer->timerType() == Qt::PreciseTimer;
    });
}

/// What the reports of single changes say that the daemon was handed.
QList<QJsonObject> changesAt(const RecordedService& daemon)
{
    QList<QJsonObject> changes;
    const auto calls = daemon.calls();
    for (const QDBusMessage& call : calls) {
        const QVariantList arguments = call.arguments();
        if (arguments.value(0) == velk::kUploadInfoLogUrl) {
            const auto report = QJsonDocument::fromJson(arguments.value(1).toString().toUtf8());
            changes.append(report.object().value(QLatin1String("payload")).toObject());
        }
    }
    return changes;
}

} // namespace

/// What callers may ask for that no policy and no launcher leads to. Runs as a domain user with a daemon, a
/// login manager and a notification service that only record.
class MessageTransferTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_daemon = std::make_unique<RecordedService>(QDBusConnection::SystemBus,
                                                     QStringLiteral("com.norix.velk.velkg"), answerNothing);
        m_logind = std::make_unique<RecordedService>(QDBusConnection::SystemBus,
                                                     QStringLiteral("org.freedesktop.login1"), answerNothing);
        m_notifications = std::make_unique<RecordedService>(
            QDBusConnection::SessionBus, QStringLiteral("com.norix.kpx.Notification"), answerNothing);
    }

    void cleanup()
    {
        pretendedUid().reset();
        m_notifications.reset();
        m_logind.reset();
        m_daemon.reset();
    }

    void missingUidNamesRootAndMissingPayloadNobody()
    {
        QJsonObject withoutUid{{QStringLiteral("payload"), QJsonObject()}};
        QJsonObject withoutPayload;
        MessageTransfer transfer;
        for (const uid_t uid : {0U, 1U, static_cast<uid_t>(-1)}) {
            pretendedUid() = uid;
            QCOMPARE(transfer.isExecPolicyByUID(withoutUid), uid == 0);
            QVERIFY(!transfer.isExecPolicyByUID(withoutPayload));
        }
    }

    void countdownEndsWithTheActionOfItsCode_data()
    {
        QTest::addColumn<int>("code");
        QTest::addColumn<QStringList>("actions");
        QTest::newRow("domain exit") << 1200 << QStringList{QStringLiteral("Reboot")};
        for (const int code : {1201, 1202, 1203}) {
            QTest::addRow("log-out %d", code) << code << QStringList{QStringLiteral("Terminate")};
        }
        for (const int code : {0, 1100, 1300, 1304}) {
            QTest::addRow("no forced action %d", code) << code << QStringList();
        }
    }

    void countdownEndsWithTheActionOfItsCode()
    {
        QFETCH(int, code);
        MessageTransfer transfer;
        QVERIFY(!isCountingDown(transfer));
        transfer.startTime(QString(), code);
        QVERIFY(isCountingDown(transfer));
        transfer.onTimeout();
        QVERIFY(!isCountingDown(transfer));
        QTEST(forcedActions(*m_logind), "actions");
    }

    void expiryKeepsThePendingCode()
    {
        MessageTransfer transfer;
        transfer.startTime(QString(), 1201);
        transfer.onTimeout();
        transfer.onTimeout();
        QCOMPARE(forcedActions(*m_logind).size(), 2);
    }

    void changeReportsWhatItIsGiven_data()
    {
        QTest::addColumn<QStringList>("info");
        QTest::addColumn<QString>("name");
        QTest::addColumn<QString>("version");

        const QString editor = QStringLiteral("Editor");
        const QString version = QStringLiteral("2.1");
        QTest::newRow("nothing") << QStringList() << QString() << QString();
        QTest::newRow("name") << QStringList{editor} << editor << QString();
        QTest::newRow("name and version") << QStringList{editor, version} << editor << version;
        QTest::newRow("more") << QStringList{editor, version, QStringLiteral("more")} << editor << version;
    }

    void changeReportsWhatItIsGiven()
    {
        QFETCH(QStringList, info);
        MessageTransfer transfer;

        transfer.uploadSoftware(QStringLiteral("created"), info);
        transfer.onSoftwareChanged(QStringLiteral("update"), info);

        QTRY_COMPARE(changesAt(*m_daemon).size(), 2);
        const auto changes = changesAt(*m_daemon);
        for (const QJsonObject& change : changes) {
            QTEST(change.value(QLatin1String("software_name")).toString(), "name");
            QTEST(change.value(QLatin1String("software_version")).toString(), "version");
        }
        QCOMPARE(changes.at(0).value(QLatin1String("type")).toInt(), 1);
        QCOMPARE(changes.at(1).value(QLatin1String("type")).toInt(), 2);
    }

private:
    std::unique_ptr<RecordedService> m_daemon;
    std::unique_ptr<RecordedService> m_logind;
    std::unique_ptr<RecordedService> m_notifications;
};

QTEST_GUILESS_MAIN(MessageTransferTest)
#include "message_transfer_test.moc"
