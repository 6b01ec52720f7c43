#include <QDBusObjectPath>
#include <QSignalSpy>
#include <QTest>

#include "appopenspy.h"
#include "at_log_line.h"
#include "launcher_guard.h"
#include "property_service.h"
#include "service_arrival.h"

using velk::module::software::AppOpenSpy;

namespace {

const QString dockService = QStringLiteral("com.norix.kpx.daemon.Dock");
const QString launcherService = QStringLiteral("com.norix.kpx.daemon.Launcher");
const QString anyService = QStringLiteral("com.norix.Any");

std::unique_ptr<PropertyService> dockWithOneApp()
{
    const QString entry = QStringLiteral("/entry");
    auto dock = std::make_unique<PropertyService>(dockService);
    dock->set(QStringLiteral("/com/norix/kpx/daemon/Dock"), QStringLiteral("Entries"),
              QVariant::fromValue(QList<QDBusObjectPath>{QDBusObjectPath(entry)}));
    dock->set(entry, QStringLiteral("Id"), QStringLiteral("e0"));
    dock->set(entry, QStringLiteral("Name"), QStringLiteral("编辑器"));
    dock->set(entry, QStringLiteral("IsDocked"), false);
    return dock;
}

} // namespace

/// Desktop services that come at the worst moment: after they were missed and before they are watched for.
class DesktopArrivalTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void serviceThatComesLaterHasArrived()
    {
        auto* arrival = new ServiceArrival(anyService, nullptr);
        QSignalSpy arrived(arrival, &ServiceArrival::arrived);
        QSignalSpy gone(arrival, &QObject::destroyed);
        QCoreApplication::processEvents();
        QCOMPARE(arrived.size(), 0);

        const RecordedService service(QDBusConnection::SessionBus, anyService, answerNothing);
        QVERIFY(arrived.wait());
        QVERIFY(gone.wait());
    }

    void serviceThatComesTwiceHasArrivedOnce()
    {
        int arrivals = 0;
        QPointer<ServiceArrival> arrival(new ServiceArrival(anyService, nullptr));
        connect(arrival, &ServiceArrival::arrived, [&arrivals] { ++arrivals; });
        for (int time = 0; time < 2; ++time) {
            const RecordedService service(QDBusConnection::SessionBus, anyService, answerNothing);
        }
        QTRY_VERIFY(arrival.isNull());
        QCOMPARE(arrivals, 1);
    }

    void serviceThatIsThereAlreadyArrivesOnceTheSignalCanBeConnected()
    {
        const RecordedService service(QDBusConnection::SessionBus, anyService, answerNothing);
        bool signalled = false;
        QObject parent;
        auto* arrival = new ServiceArrival(anyService, &parent);
        connect(arrival, &ServiceArrival::arrived, [&signalled] { signalled = true; });
        QVERIFY(!signalled);
        QTRY_VERIFY(signalled);
    }

    void dockThatComesWhileItIsMissedIsNoticed()
    {
        std::unique_ptr<PropertyService> dock;
        const AtLogLine comes("dock service is not registered, wait..", [&dock] { dock = dockWithOneApp(); });

        QSignalSpy states(AppOpenSpy::instance(), &AppOpenSpy::appStateChange);

        QVERIFY(states.wait());
        QCOMPARE(states, (QList<QVariantList>{{1, QStringLiteral("编辑器")}}));
    }

    void launcherThatComesWhileItIsMissedIsNoticed()
    {
        std::unique_ptr<RecordedService> launcher;
        const AtLogLine comes("launcher service is not registered, wait..", [&launcher] {
            launcher = std::make_unique<RecordedService>(QDBusConnection::SessionBus, launcherService,
                                                         answerNothing);
        });

        const LauncherGuard guard(nullptr);
        QSignalSpy inited(&guard, &LauncherGuard::softwareInited);

        QVERIFY(inited.wait());
        QCOMPARE(inited.size(), 1);
    }
};

QTEST_GUILESS_MAIN(DesktopArrivalTest)
#include "desktop_arrival_test.moc"
