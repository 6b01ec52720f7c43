#include <QTest>

#include "bus_client.h"
#include "launcherd.h"
#include "recorded_service.h"

namespace {

const QString service = QStringLiteral("com.norix.kpx.daemon.Launcher");
const QString path = QStringLiteral("/com/norix/kpx/daemon/Launcher");

LauncherItemInfo item()
{
    return {QStringLiteral("/a.desktop"),
            QStringLiteral("编辑器"),
            QStringLiteral("b"),
            QStringLiteral("c"),
            -1,
            2};
}

} // namespace

/// The launcher, as seen by its proxy on a real bus.
class DesktopProxiesLauncherTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        registerLauncherItemInfoMetaType();
        registerLauncherItemInfoListMetaType();
    }

    void itemsComeInTheLaunchersOrder()
    {
        const LauncherItemInfoList items{item(), {}, item()};
        const RecordedService launcher(QDBusConnection::SessionBus, service,
                                       answerWith(QVariant::fromValue(items)));
        BusClient agent;
        __Launcherd proxy(service, path, agent.bus());
        QVERIFY(proxy.isValid());

        QDBusPendingReply<LauncherItemInfoList> reply = proxy.GetAllItemInfos();
        reply.waitForFinished();

        QCOMPARE(reply.value().size(), 3);
        QCOMPARE(reply.value().at(0).name, item().name);
        QCOMPARE(reply.value().at(1).name, QString());
        const QDBusMessage call = launcher.calls().constFirst();
        QCOMPARE(QStringList({call.path(), call.interface(), call.member(), call.signature()}),
                 QStringList({path, service, QStringLiteral("GetAllItemInfos"), QString()}));
    }

    void replyOfAnotherTypeIsAnError()
    {
        const RecordedService launcher(QDBusConnection::SessionBus, service,
                                       answerWith(QStringLiteral("items")));
        BusClient agent;
        QDBusPendingReply<LauncherItemInfoList> reply =
            __Launcherd(service, path, agent.bus()).GetAllItemInfos();
        reply.waitForFinished();
        QVERIFY(reply.isError());
    }

    void changedItemIsSignalled()
    {
        const RecordedService launcher(QDBusConnection::SessionBus, service, answerNothing);
        BusClient agent;
        const __Launcherd proxy(service, path, agent.bus());
        QSignalSpy changed(&proxy, &__Launcherd::ItemChanged);
        agent.settle();

        const QVariantList change{QStringLiteral("created"), QVariant::fromValue(item()), 7LL};
        launcher.emitSignal(signalOf(path, service, "ItemChanged", change), agent.bus());

        QCOMPARE(changed.size(), 1);
        QCOMPARE(changed.first().value(0).toString(), QStringLiteral("created"));
        QCOMPARE(changed.first().value(1).value<LauncherItemInfo>().name, item().name);
        QCOMPARE(changed.first().value(2).toLongLong(), 7);
    }
};

QTEST_GUILESS_MAIN(DesktopProxiesLauncherTest)
#include "desktopproxies_launcher_test.moc"
