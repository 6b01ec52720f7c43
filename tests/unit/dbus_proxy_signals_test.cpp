#include "bus_client.h"
#include "proxies.h"

#include <QTest>

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

void addArrival(const QString& interface, const char* name, const QVariantList& arguments)
{
    QTest::addRow("%s.%s", qPrintable(interface), name)
        << interface << QString::fromLatin1(name) << arguments;
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
    void signalOfTheServiceArrives_data();
    void signalOfTheServiceArrives();
    void signalSentStraightByTheServiceArrives();
    void signalOfAServiceThatCameLaterArrives();
    void signalOfARestartedServiceArrives();
    void signalOfAnotherPathOrInterfaceIsDropped_data();
    void signalOfAnotherPathOrInterfaceIsDropped();
    void signalOfAnotherSenderIsDroppedBesideTheService_data() { addSenderRows(); }
    void signalOfAnotherSenderIsDroppedBesideTheService();
    void signalOfAnotherSenderIsDroppedBeforeTheService_data() { addSenderRows(); }
    void signalOfAnotherSenderIsDroppedBeforeTheService();
    void signalOfAnotherSenderIsDroppedAfterTheService_data() { addSenderRows(); }
    void signalOfAnotherSenderIsDroppedAfterTheService();

private:
    static void addSenderRows()
    {
        QTest::addColumn<Foreign>("foreign");
        addForeignRows("another sender", path, velkg);
    }
};

void DBusProxySignalsTest::signalOfTheServiceArrives_data()
{
    QTest::addColumn<QString>("interface");
    QTest::addColumn<QString>("name");
    QTest::addColumn<QVariantList>("arguments");

    const QString text = QStringLiteral("策略");
    const QString empty;
    addArrival(velkg, "pushOnlineMsg", {});
    addArrival(velkg, "pushPolicyMsg", {QStringLiteral("app"), text});
    addArrival(velkg, "requestSendAppOpenState", {-1, text});
    addArrival(velkg, "requestSetStoragePerm", {2, 3});
    addArrival(pryg, "NotifyReportConnInfo", {text, QStringLiteral("1d6b"), empty, text, empty});
    addArrival(pryg, "RequestShowNormalSysNotify", {text});
    addArrival(pryg, "RequestShowUsbCtrlAuthorSysNotify", {true, text});
    addArrival(pryg, "notifyMsg", {text, 5});
}

void DBusProxySignalsTest::signalOfTheServiceArrives()
{
    QFETCH(const QString, interface);
    QFETCH(const QString, name);
    QFETCH(const QVariantList, arguments);
    BusClient server;
    QVERIFY(server.bus().registerService(service));
    BusClient client;
    Proxies proxies(service, path, client.bus());
    QSignalSpy received(&proxies.of(interface), signalNamed(proxies.of(interface), name));
    client.settle();

    QDBusMessage message = QDBusMessage::createSignal(path, interface, name);
    message.setArguments(arguments);
    server.bus().send(message);
    server.deliverTo(client);

    QCOMPARE(received.size(), 1);
    QCOMPARE(received.first(), arguments);
}

void DBusProxySignalsTest::signalSentStraightByTheServiceArrives()
{
    BusClient server;
    QVERIFY(server.bus().registerService(service));
    Listener agent;

    send(server, agent.client, {path, velkg, false});

    QCOMPARE(agent.received.size(), 1);
}

void DBusProxySignalsTest::signalOfAServiceThatCameLaterArrives()
{
    Listener agent;
    BusClient server;
    QVERIFY(server.bus().registerService(service));

    send(server, agent.client, {path, velkg});

    QCOMPARE(agent.received.size(), 1);
}

void DBusProxySignalsTest::signalOfARestartedServiceArrives()
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

void DBusProxySignalsTest::signalOfAnotherPathOrInterfaceIsDropped_data()
{
    QTest::addColumn<Foreign>("foreign");
    addForeignRows("another path", path + QStringLiteral("/below"), velkg);
    addForeignRows("root path", QStringLiteral("/"), velkg);
    addForeignRows("another interface", path, pryg);
}

void DBusProxySignalsTest::signalOfAnotherPathOrInterfaceIsDropped()
{
    QFETCH(const Foreign, foreign);
    BusClient server;
    QVERIFY(server.bus().registerService(service));
    Listener agent;

    send(server, agent.client, foreign);

    QCOMPARE(agent.received.size(), 0);
}

void DBusProxySignalsTest::signalOfAnotherSenderIsDroppedBesideTheService()
{
    QFETCH(const Foreign, foreign);
    BusClient server;
    QVERIFY(server.bus().registerService(service));
    Listener agent;
    BusClient stranger;

    send(stranger, agent.client, foreign);

    QCOMPARE(agent.received.size(), 0);
}

void DBusProxySignalsTest::signalOfAnotherSenderIsDroppedBeforeTheService()
{
    QFETCH(const Foreign, foreign);
    Listener agent;
    BusClient stranger;

    send(stranger, agent.client, foreign);

    QCOMPARE(agent.received.size(), 0);
}

void DBusProxySignalsTest::signalOfAnotherSenderIsDroppedAfterTheService()
{
    QFETCH(const Foreign, foreign);
    BusClient formerServer;
    QVERIFY(formerServer.bus().registerService(service));
    Listener agent;
    QVERIFY(formerServer.bus().unregisterService(service));

    send(formerServer, agent.client, foreign);

    QCOMPARE(agent.received.size(), 0);
}

QTEST_GUILESS_MAIN(DBusProxySignalsTest)
#include "dbus_proxy_signals_test.moc"
