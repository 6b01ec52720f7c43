#include <QTest>

#include "bus_client.h"
#include "dock.h"
#include "property_service.h"

namespace {

const QString service = QStringLiteral("com.norix.kpx.daemon.Dock");
const QString path = QStringLiteral("/com/norix/kpx/daemon/Dock");
const QString entries = QStringLiteral("Entries");

} // namespace

/// The dock itself, as seen by its proxy on a real bus.
class DesktopProxiesDockTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void entriesComeInTheDocksOrder()
    {
        const QList<QDBusObjectPath> paths{QDBusObjectPath("/z"), QDBusObjectPath("/a"),
                                           QDBusObjectPath("/z")};
        PropertyService dock(service);
        dock.set(path, entries, QVariant::fromValue(paths));
        BusClient agent;
        const __Dock proxy(service, path, agent.bus());
        QVERIFY(proxy.isValid());
        QCOMPARE(proxy.entries(), paths);
    }

    void dockThatDoesNotAnswerProperlyHasNoEntries()
    {
        PropertyService dock(service);
        BusClient agent;
        const __Dock proxy(service, path, agent.bus());
        QVERIFY(proxy.entries().isEmpty());
        for (const QVariant& value : {QVariant(7), QVariant(QStringList{QStringLiteral("/a")})}) {
            dock.set(path, entries, value);
            QVERIFY(proxy.entries().isEmpty());
        }
    }

    void absentDockIsInvalidAndHasNoEntries()
    {
        BusClient agent;
        const __Dock proxy(service, path, agent.bus());
        QVERIFY(!proxy.isValid());
        QVERIFY(proxy.entries().isEmpty());
    }

    void addedAndRemovedEntriesAreSignalled()
    {
        PropertyService dock(service);
        BusClient agent;
        const __Dock proxy(service, path, agent.bus());
        QSignalSpy added(&proxy, &__Dock::EntryAdded);
        QSignalSpy removed(&proxy, &__Dock::EntryRemoved);
        agent.settle();

        const QDBusObjectPath entry("/entry");
        dock.service().emitSignal(signalOf(path, service, "EntryAdded", {QVariant::fromValue(entry), 3}),
                                  agent.bus());
        dock.service().emitSignal(signalOf(path, service, "EntryRemoved", {QStringLiteral("e0")}),
                                  agent.bus());

        QCOMPARE(added.size(), 1);
        QCOMPARE(added.first().value(0).value<QDBusObjectPath>(), entry);
        QCOMPARE(added.first().value(1).toInt(), 3);
        QCOMPARE(removed, (QList<QVariantList>{{QStringLiteral("e0")}}));
    }
};

QTEST_GUILESS_MAIN(DesktopProxiesDockTest)
#include "desktopproxies_dock_test.moc"
