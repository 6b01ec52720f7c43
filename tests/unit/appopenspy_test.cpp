#include <QDBusMetaType>
#include <QDBusObjectPath>
#include <QSignalSpy>
#include <QTest>

#include "appopenspy.h"
#include "at_log_line.h"
#include "log_recorder.h"
#include "property_service.h"

using velk::module::software::AppOpenSpy;

namespace {

const QString service = QStringLiteral("com.norix.kpx.daemon.Dock");
const QString path = QStringLiteral("/com/norix/kpx/daemon/Dock");

} // namespace

/// A dock that is there, with applications, when the agent begins to watch it.
class AppOpenSpyTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void openApplicationsAreSignalledOnceAndBeforeLaterChanges()
    {
        qDBusRegisterMetaType<QMap<uint, QString>>();
        PropertyService dock(service);
        QList<QDBusObjectPath> paths;
        for (const QString& name : {QStringLiteral("z"), QStringLiteral("y"), QStringLiteral("a")}) {
            addEntry(dock, name, name == QLatin1String("y"));
            paths.append(QDBusObjectPath(QLatin1Char('/') + name));
        }
        dock.set(path, QStringLiteral("Entries"), QVariant::fromValue(paths));

        // Until the event loop has run once, Qt holds back what comes in.
        QVERIFY(QDBusConnection::sessionBus().isConnected());
        QCoreApplication::processEvents();
        const LogRecorder log;
        const auto send = [&dock](const char* member, const QVariantList& arguments) {
            dock.service().send(signalOf(path, service, member, arguments));
        };
        AppOpenSpy* spy = nullptr;
        {
            const AtLogLine whileTheAgentReads("dock entry size:", [&send] {
                send("EntryRemoved", {QStringLiteral("z")});
                send("EntryAdded", {QVariant::fromValue(QDBusObjectPath("/z")), 0});
            });
            spy = AppOpenSpy::instance();
        }

        QCOMPARE(log.lines(), QStringList{QStringLiteral("info: dock entry size: 3")});
        QCOMPARE(AppOpenSpy::instance(), spy);
        QSignalSpy states(spy, &AppOpenSpy::appStateChange);
        QCOMPARE(states.size(), 0);
        const QString removedOne = QStringLiteral("Z");
        QTRY_COMPARE(states,
                     (QList<QVariantList>{
                         {1, removedOne}, {1, QStringLiteral("A")}, {2, removedOne}, {1, removedOne}}));
    }

private:
    static void addEntry(PropertyService& dock, const QString& name, bool docked)
    {
        const QString entry = QLatin1Char('/') + name;
        dock.set(entry, QStringLiteral("Id"), name);
        dock.set(entry, QStringLiteral("Name"), name.toUpper());
        dock.set(entry, QStringLiteral("IsDocked"), docked);
        dock.set(entry, QStringLiteral("WindowInfos"), QVariant::fromValue(QMap<uint, QString>{{1, name}}));
    }
};

QTEST_GUILESS_MAIN(AppOpenSpyTest)
#include "appopenspy_test.moc"
