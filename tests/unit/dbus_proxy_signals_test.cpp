#include <QTest>

#include "bus_client.h"
#include "proxies.h"

namespace {

const QString service = QStringLiteral("org.example.service");
const QString path = QStringLiteral("/org/example/object");
const QString velkg = QStringLiteral("com.norix.velk.velkg");
const QString pryg = QStringLiteral("com.norix.velk.pryg");
const QString member = QStringLiteral("pushPolicyMsg");
const QVariantList policy = {QStringLiteral("app"), QStringLiteral("{\"code\":1201}")};

/// How a signal that is not the service's own differs from it, and how it is sent.
struct Foreign
{
    QString path;
    QString interface;
    bool broadcast = true;
};

void addForeignRows(const char* difference, const QString& fromPath, const QString& interface)
{
    QTest::addRow("%s, broadcast", difference) << Foreign{fromPath, interface, true};
    QTest::addRow("%s, sent straight", difference) << Foreign{fromPath, interface, false};
}

/// Sends pushPolicyMsg and returns once the receiver has delivered or dropped it.
void send(BusClient& sender, const BusClient& receiver, const Foreign& as)
{
    QDBusMessage message = as.broadcast
        ? QDBusMessage::createSignal(as.path, as.interface, member)
        : QDBusMessage::createTargetedSignal(receiver.uniqueName(), as.path, as.interface, member);
    message.setArguments(policy);
    sender.bus().send(message);
    sender.deliverTo(receiver);
}

/// The agent's side: a proxy whose pushPolicyMsg is listened to, the match rule being in force.
struct Listener
{
    BusClient client;
    velkgInterface proxy = {service, path, client.bus()};
    QSignalSpy received = {&proxy, &velkgInterface::pushPolicyMsg};

    Listener() { client.settle(); }
};

} // namespace
Q_DECLARE_METATYPE(Foreign)

/// Signals that reach the proxies, and those that must not, on a real bus.
class DBusProxySignalsTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void signalSentStraightByTheServiceArrives()
    {
        BusClient server;
        QVERIFY(server.bus().registerService(service));
        Listener agent;

        send(server, agent.client, {path, velkg, false});

        QCOMPARE(agent.received.size(), 1);
    }

    void signalOfAServiceThatCameLaterArrives()
    {
        Listener agent;
        BusClient server;
        QVERIFY(server.bus().registerService(service));

        send(server, agent.client, {path, velkg});

        QCOMPARE(agent.received.size(), 1);
    }

    void signalOfARestartedServiceArrives()
    {
        BusClient first;
        QVERIFY(first.bus().registerService(service));
        Listener agent;
        QVERIFY(first.bus().unregisterService(service));
        BusClient second;
        QVERIFY(second.bus().registerService(service));

        send(second, agent.client, {path, velkg});

        QCOMPARE(agent.received.size(), 1);
    }

    void signalOfAnotherPathOrInterfaceIsDropped_data()
    {
        QTest::addColumn<Foreign>("foreign");
        addForeignRows("another path", path + QStringLiteral("/below"), velkg);
        addForeignRows("root path", QStringLiteral("/"), velkg);
        addForeignRows("another interface", path, pryg);
    }

    void signalOfAnotherPathOrInterfaceIsDropped()
    {
        QFETCH(const Foreign, foreign);
        BusClient server;
        QVERIFY(server.bus().registerService(service));
        Listener agent;

        send(server, agent.client, foreign);

        QCOMPARE(agent.received.size(), 0);
    }

    void signalOfAnotherSenderIsDropped_data()
    {
        QTest::addColumn<bool>("broadcast");
        QTest::addColumn<bool>("serviceWasThere");
        QTest::addColumn<bool>("serviceIsThere");
        for (const bool broadcast : {true, false}) {
            const char* way = broadcast ? "broadcast" : "sent straight";
            QTest::addRow("before the service, %s", way) << broadcast << false << false;
            QTest::addRow("beside the service, %s", way) << broadcast << true << true;
            QTest::addRow("after the service, %s", way) << broadcast << true << false;
        }
    }

    void signalOfAnotherSenderIsDropped()
    {
        QFETCH(bool, broadcast);
        QFETCH(bool, serviceWasThere);
        QFETCH(bool, serviceIsThere);
        BusClient server;
        QVERIFY(!serviceWasThere || server.bus().registerService(service));
        Listener agent;
        QVERIFY(serviceIsThere || !serviceWasThere || server.bus().unregisterService(service));
        BusClient stranger;

        send(serviceIsThere ? stranger : server, agent.client, {path, velkg, broadcast});

        QCOMPARE(agent.received.size(), 0);
    }
};

QTEST_GUILESS_MAIN(DBusProxySignalsTest)
#include "dbus_proxy_signals_test.moc"
