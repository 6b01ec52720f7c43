#include <QJsonDocument>
#include <QJsonObject>
#include <QtTest>

#include "constants.h"
#include "message_transfer.h"
#include "recorded_service.h"

namespace {

/// What the reports of single changes say that the daemon was handed.
QList<QJsonObject> changesAt(const RecordedService& daemon)
{
    QList<QJsonObject> changes;
    const auto calls = daemon.calls();
    for (const QDBusMessage& call : calls) {
        const QVariantList arguments = call.arguments();
        if (call.member() == QLatin1String("onUploadFinished")
            && arguments.value(0) == velk::kUploadInfoLogUrl) {
            const auto report = QJsonDocument::fromJson(arguments.value(1).toString().toUtf8());
            changes.append(report.object().value(QLatin1String("payload")).toObject());
        }
    }
    return changes;
}

} // namespace

/// What callers of the software's upload may leave out. There is a daemon and no launcher.
class MessageTransferSoftwareTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void changeReportsWhatItIsGiven_data()
    {
        QTest::addColumn<QString>("action");
        QTest::addColumn<int>("change");
        QTest::addColumn<QStringList>("info");
        QTest::addColumn<QString>("name");
        QTest::addColumn<QString>("version");

        const QString editor = QStringLiteral("Editor");
        const QString version = QStringLiteral("2.1");
        const QMap<QString, int> actions{{QStringLiteral("created"), 1}, {QStringLiteral("update"), 2}};
        for (auto action = actions.cbegin(); action != actions.cend(); ++action) {
            const auto row = [&](const char* given) -> QTestData& {
                return QTest::addRow("%s, %s", qPrintable(action.key()), given)
                    << action.key() << action.value();
            };
            row("nothing") << QStringList() << QString() << QString();
            row("name") << QStringList{editor} << editor << QString();
            row("name and version") << QStringList{editor, version} << editor << version;
            row("more") << QStringList{editor, version, QStringLiteral("more")} << editor << version;
        }
    }

    void changeReportsWhatItIsGiven()
    {
        QFETCH(QString, action);
        QFETCH(QStringList, info);
        const RecordedService daemon(QDBusConnection::SystemBus, QStringLiteral("com.norix.velk.velkg"),
                                     answerNothing);
        MessageTransfer transfer;

        transfer.uploadSoftware(action, info);
        transfer.onSoftwareChanged(action, info);

        QTRY_COMPARE(changesAt(daemon).size(), 2);
        const auto changes = changesAt(daemon);
        for (const QJsonObject& change : changes) {
            QTEST(change.value(QLatin1String("type")).toInt(), "change");
            QTEST(change.value(QLatin1String("software_name")).toString(), "name");
            QTEST(change.value(QLatin1String("software_version")).toString(), "version");
        }
    }
};

QTEST_GUILESS_MAIN(MessageTransferSoftwareTest)
#include "message_transfer_software_test.moc"
