#include <QDBusError>
#include <QTest>

#include <functional>

#include "bus_client.h"
#include "proxies.h"
#include "recorded_service.h"

using Call = std::function<QDBusPendingCall(Proxies&)>;
using Read = std::function<QVariant(velkgInterface&)>;
Q_DECLARE_METATYPE(Call)
Q_DECLARE_METATYPE(Read)

namespace {

const QString service = QStringLiteral("org.example.service");
const QString path = QStringLiteral("/org/example/object");
const QString velkg = QStringLiteral("com.norix.velk.velkg");
const QString pryg = QStringLiteral("com.norix.velk.pryg");
const QString prys = QStringLiteral("com.norix.velk.prys");

void addCall(const QString& interface, const char* member, const char* signature,
             const QVariantList& arguments, const Call& call)
{
    QTest::addRow("%s.%s", qPrintable(interface), member)
        << interface << QString::fromLatin1(member) << QString::fromLatin1(signature) << arguments << call;
}

void addReply(const char* member, const QVariant& reply, const Read& read)
{
    QTest::newRow(member) << reply << read;
}

} // namespace

/// Calls of the proxies to a service that the test plays itself, on a real bus.
class DBusProxyCallsTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void callGoesOutAsDeclared_data()
    {
        QTest::addColumn<QString>("interface");
        QTest::addColumn<QString>("member");
        QTest::addColumn<QString>("signature");
        QTest::addColumn<QVariantList>("arguments");
        QTest::addColumn<Call>("call");

        const QString text = QStringLiteral("密码即将过期");
        const QString url = QStringLiteral("https://%1:%2/");
        addCall(velkg, "GetDomainStatus", "", {}, [](auto& on) { return on.velkg.GetDomainStatus(); });
        addCall(velkg, "GetMachineID", "", {}, [](auto& on) { return on.velkg.GetMachineID(); });
        addCall(velkg, "GetNetStatus", "", {}, [](auto& on) { return on.velkg.GetNetStatus(); });
        addCall(velkg, "GetPolicyPullTime", "", {}, [](auto& on) { return on.velkg.GetPolicyPullTime(); });
        addCall(velkg, "GetServerIP", "", {}, [](auto& on) { return on.velkg.GetServerIP(); });
        addCall(velkg, "GetServerPort", "", {}, [](auto& on) { return on.velkg.GetServerPort(); });
        addCall(velkg, "SendUserStatus", "is", {3, text},
                [=](auto& on) { return on.velkg.SendUserStatus(3, text); });
        addCall(velkg, "UpdateUserInfo", "si", {text, -7},
                [=](auto& on) { return on.velkg.UpdateUserInfo(text, -7); });
        addCall(velkg, "onDomainConfig", "s", {text},
                [=](auto& on) { return on.velkg.onDomainConfig(text); });
        addCall(velkg, "onPolicyFinished", "iiis", {1, 2, 3, text},
                [=](auto& on) { return on.velkg.onPolicyFinished(1, 2, 3, text); });
        addCall(velkg, "onUploadFinished", "ss", {url, text},
                [=](auto& on) { return on.velkg.onUploadFinished(url, text); });
        addCall(velkg, "sendAppOpenState", "is", {2, url},
                [=](auto& on) { return on.velkg.sendAppOpenState(2, url); });
        addCall(pryg, "PullAndExeSysPolicy", "", {}, [](auto& on) { return on.pryg.PullAndExeSysPolicy(); });
        addCall(pryg, "onPolicyMsg", "s", {text}, [=](auto& on) { return on.pryg.onPolicyMsg(text); });
        addCall(prys, "onPolicyMsg", "s", {text}, [=](auto& on) { return on.prys.onPolicyMsg(text); });
    }

    void callGoesOutAsDeclared()
    {
        QFETCH(const QString, interface);
        QFETCH(const QString, member);
        QFETCH(const QString, signature);
        QFETCH(const QVariantList, arguments);
        QFETCH(const Call, call);
        const RecordedService server(QDBusConnection::SessionBus, service, answerNothing);
        BusClient client;
        Proxies proxies(service, path, client.bus());

        call(proxies).waitForFinished();

        const QList<QDBusMessage> calls = server.calls();
        QCOMPARE(calls.size(), 1);
        const QDBusMessage& received = calls.first();
        QCOMPARE(received.path(), path);
        QCOMPARE(received.interface(), interface);
        QCOMPARE(received.member(), member);
        QCOMPARE(received.signature(), signature);
        QCOMPARE(received.arguments(), arguments);
    }

    void readingTheValueWaitsForTheTypedReply_data()
    {
        QTest::addColumn<QVariant>("reply");
        QTest::addColumn<Read>("read");

        const QString text = QStringLiteral("终端");
        addReply("GetDomainStatus", 1, [](auto& proxy) { return proxy.GetDomainStatus().value(); });
        addReply("GetMachineID", text, [](auto& proxy) { return proxy.GetMachineID().value(); });
        addReply("GetNetStatus", -2, [](auto& proxy) { return proxy.GetNetStatus().value(); });
        addReply("GetPolicyPullTime", 300, [](auto& proxy) { return proxy.GetPolicyPullTime().value(); });
        addReply("GetServerIP", text, [](auto& proxy) { return proxy.GetServerIP().value(); });
        addReply("GetServerPort", text, [](auto& proxy) { return proxy.GetServerPort().value(); });
        addReply("onDomainConfig", 4, [](auto& proxy) { return proxy.onDomainConfig({}).value(); });
    }

    void readingTheValueWaitsForTheTypedReply()
    {
        QFETCH(const QVariant, reply);
        QFETCH(const Read, read);
        const RecordedService server(QDBusConnection::SessionBus, service, answerWith(reply));
        BusClient client;
        velkgInterface proxy(service, path, client.bus());

        QCOMPARE(read(proxy), reply);
    }

    void callToAnAbsentServiceFails()
    {
        BusClient client;
        Proxies proxies(service, path, client.bus());
        QVERIFY(!proxies.velkg.isValid());

        QDBusPendingReply<QString> text = proxies.velkg.GetMachineID();
        QDBusPendingReply<int> number = proxies.velkg.GetNetStatus();
        QDBusPendingReply<> nothing = proxies.prys.onPolicyMsg(QStringLiteral("{}"));
        text.waitForFinished();
        nothing.waitForFinished();

        QCOMPARE(number.value(), 0);
        QCOMPARE(text.error().type(), QDBusError::ServiceUnknown);
        QCOMPARE(number.error().type(), QDBusError::ServiceUnknown);
        QCOMPARE(nothing.error().type(), QDBusError::ServiceUnknown);
    }

    void proxyBuiltBeforeItsServiceReachesItLater()
    {
        BusClient client;
        Proxies proxies(service, path, client.bus());
        const RecordedService server(QDBusConnection::SessionBus, service, answerNothing);

        proxies.velkg.UpdateUserInfo(QStringLiteral("user"), 1).waitForFinished();
        proxies.pryg.PullAndExeSysPolicy().waitForFinished();
        proxies.prys.onPolicyMsg(QStringLiteral("{}")).waitForFinished();

        QCOMPARE(server.calls().size(), 3);
    }
};

QTEST_GUILESS_MAIN(DBusProxyCallsTest)
#include "dbus_proxy_calls_test.moc"
