#include <QDBusContext>
#include <QDBusPendingReply>
#include <QRegularExpression>
#include <QTest>

#include <functional>

#include "bus_client.h"
#include "proxies.h"
#include "pryg_adapter.h"
#include "prys_adapter.h"
#include "recorded_service.h"
#include "velkg_adapter.h"

namespace {

const QString path = QStringLiteral("/org/example/object");
const QString velkg = QStringLiteral("com.norix.velk.velkg");
const QString pryg = QStringLiteral("com.norix.velk.pryg");
const QString prys = QStringLiteral("com.norix.velk.prys");

const QString machine = QStringLiteral("机器");
const QString address = QStringLiteral("::1");
const QString port = QStringLiteral("443");

} // namespace

/// Has every method and signal of the three interfaces, and records the calls as lists of interface, method
/// and arguments.
class Implementation : public QObject, public QDBusContext
{
    Q_OBJECT

public:
    QList<QVariantList> calls;

public Q_SLOTS:
    int GetDomainStatus() { return record(__func__), 11; }
    QString GetMachineID() { return record(__func__), machine; }
    int GetNetStatus() { return record(__func__), 12; }
    int GetPolicyPullTime() { return record(__func__), 13; }
    QString GetServerIP() { return record(__func__), address; }
    QString GetServerPort() { return record(__func__), port; }
    void SendUserStatus(int type, const QString& userName) { record(__func__, {type, userName}); }
    void UpdateUserInfo(const QString& name, int id) { record(__func__, {name, id}); }
    int onDomainConfig(const QString& type) { return record(__func__, {type}), -14; }
    void onPolicyFinished(int taskID, int jobID, int code, const QString& ack)
    {
        record(__func__, {taskID, jobID, code, ack});
    }
    void onUploadFinished(const QString& url, const QString& data) { record(__func__, {url, data}); }
    void sendAppOpenState(int type, const QString& appName) { record(__func__, {type, appName}); }
    void PullAndExeSysPolicy() { record(__func__); }
    void onPolicyMsg(const QString& payload) { record(__func__, {payload}); }

    // NOLINTBEGIN(readability-inconsistent-declaration-parameter-name): moc names them anew
Q_SIGNALS:
    void pushOnlineMsg();
    void pushPolicyMsg(const QString& appID, const QString& payload);
    void requestSendAppOpenState(int type, const QString& appName);
    void requestSetStoragePerm(int type, int mode);
    void NotifyReportConnInfo(const QString& usbName, const QString& vendorID, const QString& productID,
                              const QString& serial, const QString& status);
    void RequestShowNormalSysNotify(const QString& msg);
    void RequestShowUsbCtrlAuthorSysNotify(bool isAdd, const QString& devName);
    void notifyMsg(const QString& msg, int type);
    // NOLINTEND(readability-inconsistent-declaration-parameter-name)

private:
    void record(const char* method, const QVariantList& arguments = {})
    {
        calls << QVariantList{message().interface(), QString::fromLatin1(method)} + arguments;
    }
};

using Call = std::function<QDBusPendingCall(Proxies&)>;
using Emit = std::function<void(Implementation&)>;
Q_DECLARE_METATYPE(Call)
Q_DECLARE_METATYPE(Emit)

namespace {

/// An object on the bus, exported through the three adapters, and a client with proxies of it.
template <typename Object> struct Exported
{
    BusClient server;
    Object object;
    BusClient client;
    Proxies proxies = {server.uniqueName(), path, client.bus()};

    Exported()
    {
        new velkgAdapter(&object);
        new prygAdapter(&object);
        new prysAdapter(&object);
        server.bus().registerObject(path, &object, QDBusConnection::ExportAdaptors);
    }
};

void row(const QString& interface, const char* method, const QVariantList& arguments,
         const QVariantList& reply, const QVariantList& emptyReply, const Call& call)
{
    QTest::addRow("%s.%s", qPrintable(interface), method)
        << interface << QString::fromLatin1(method) << arguments << reply << emptyReply << call;
}

void addMethods()
{
    QTest::addColumn<QString>("interface");
    QTest::addColumn<QString>("method");
    QTest::addColumn<QVariantList>("arguments");
    QTest::addColumn<QVariantList>("reply");
    QTest::addColumn<QVariantList>("emptyReply");
    QTest::addColumn<Call>("call");

    const QString text = QStringLiteral("策略");
    const QString url = QStringLiteral("https://%1:%2/");
    const QVariantList noText = {QString()};
    row(velkg, "GetDomainStatus", {}, {11}, {0}, [](auto& on) { return on.velkg.GetDomainStatus(); });
    row(velkg, "GetMachineID", {}, {machine}, noText, [](auto& on) { return on.velkg.GetMachineID(); });
    row(velkg, "GetNetStatus", {}, {12}, {0}, [](auto& on) { return on.velkg.GetNetStatus(); });
    row(velkg, "GetPolicyPullTime", {}, {13}, {0}, [](auto& on) { return on.velkg.GetPolicyPullTime(); });
    row(velkg, "GetServerIP", {}, {address}, noText, [](auto& on) { return on.velkg.GetServerIP(); });
    row(velkg, "GetServerPort", {}, {port}, noText, [](auto& on) { return on.velkg.GetServerPort(); });
    row(velkg, "SendUserStatus", {3, text}, {}, {},
        [=](auto& on) { return on.velkg.SendUserStatus(3, text); });
    row(velkg, "UpdateUserInfo", {text, -7}, {}, {},
        [=](auto& on) { return on.velkg.UpdateUserInfo(text, -7); });
    row(velkg, "onDomainConfig", {text}, {-14}, {0}, [=](auto& on) { return on.velkg.onDomainConfig(text); });
    row(velkg, "onPolicyFinished", {1, 2, 3, text}, {}, {},
        [=](auto& on) { return on.velkg.onPolicyFinished(1, 2, 3, text); });
    row(velkg, "onUploadFinished", {url, text}, {}, {},
        [=](auto& on) { return on.velkg.onUploadFinished(url, text); });
    row(velkg, "sendAppOpenState", {2, url}, {}, {},
        [=](auto& on) { return on.velkg.sendAppOpenState(2, url); });
    row(pryg, "PullAndExeSysPolicy", {}, {}, {}, [](auto& on) { return on.pryg.PullAndExeSysPolicy(); });
    row(pryg, "onPolicyMsg", {text}, {}, {}, [=](auto& on) { return on.pryg.onPolicyMsg(text); });
    row(prys, "onPolicyMsg", {text}, {}, {}, [=](auto& on) { return on.prys.onPolicyMsg(text); });
}

void addSignal(const QString& interface, const char* name, const QVariantList& arguments, const Emit& emitIt)
{
    QTest::addRow("%s.%s", qPrintable(interface), name)
        << interface << QString::fromLatin1(name) << arguments << emitIt;
}

} // namespace

/// The proxies and the adapters talk to each other on a real bus. tests/e2e/test_strangers.py shows whose
/// signals are dropped.
class DBusClassesTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void callReachesTheParentAndItsReplyTheCaller_data() { addMethods(); }
    void callReachesTheParentAndItsReplyTheCaller()
    {
        QFETCH(const QString, interface);
        QFETCH(const QString, method);
        QFETCH(const QVariantList, arguments);
        QFETCH(const Call, call);
        Exported<Implementation> exported;

        const QDBusPendingCall reply = call(exported.proxies);
        QVERIFY(finished(reply));

        QVERIFY2(!reply.isError(), qPrintable(reply.error().message()));
        QTEST(reply.reply().arguments(), "reply");
        QCOMPARE(exported.object.calls, (QList<QVariantList>{QVariantList{interface, method} + arguments}));
    }

    void parentWithoutTheMethodRepliesEmpty_data() { addMethods(); }
    void parentWithoutTheMethodRepliesEmpty()
    {
        QFETCH(const QString, method);
        QFETCH(const Call, call);
        Exported<QObject> exported;
        QTest::ignoreMessage(QtWarningMsg, QRegularExpression(QStringLiteral("No such method.*") + method));

        const QDBusPendingCall reply = call(exported.proxies);
        QVERIFY(finished(reply));

        QVERIFY2(!reply.isError(), qPrintable(reply.error().message()));
        QTEST(reply.reply().arguments(), "emptyReply");
    }

    void signalOfTheParentArrivesAtTheProxy_data()
    {
        QTest::addColumn<QString>("interface");
        QTest::addColumn<QString>("name");
        QTest::addColumn<QVariantList>("arguments");
        QTest::addColumn<Emit>("emitIt");

        const QString text = QStringLiteral("策略");
        const QString id = QStringLiteral("1d6b");
        addSignal(velkg, "pushOnlineMsg", {}, [](auto& from) { Q_EMIT from.pushOnlineMsg(); });
        addSignal(velkg, "pushPolicyMsg", {id, text},
                  [=](auto& from) { Q_EMIT from.pushPolicyMsg(id, text); });
        addSignal(velkg, "requestSendAppOpenState", {-1, text},
                  [=](auto& from) { Q_EMIT from.requestSendAppOpenState(-1, text); });
        addSignal(velkg, "requestSetStoragePerm", {2, 3},
                  [](auto& from) { Q_EMIT from.requestSetStoragePerm(2, 3); });
        addSignal(pryg, "NotifyReportConnInfo", {text, id, QString(), id, text},
                  [=](auto& from) { Q_EMIT from.NotifyReportConnInfo(text, id, QString(), id, text); });
        addSignal(pryg, "RequestShowNormalSysNotify", {text},
                  [=](auto& from) { Q_EMIT from.RequestShowNormalSysNotify(text); });
        addSignal(pryg, "RequestShowUsbCtrlAuthorSysNotify", {true, text},
                  [=](auto& from) { Q_EMIT from.RequestShowUsbCtrlAuthorSysNotify(true, text); });
        addSignal(pryg, "notifyMsg", {text, 4}, [=](auto& from) { Q_EMIT from.notifyMsg(text, 4); });
    }

    void signalOfTheParentArrivesAtTheProxy()
    {
        QFETCH(const QString, interface);
        QFETCH(const QString, name);
        QFETCH(const Emit, emitIt);
        Exported<Implementation> exported;
        const QDBusAbstractInterface& proxy = exported.proxies.of(interface);
        QSignalSpy received(&proxy, signalNamed(proxy, name));
        exported.client.settle();

        emitIt(exported.object);
        exported.server.deliverTo(exported.client);

        QCOMPARE(received.size(), 1);
        QTEST(static_cast<QVariantList>(received.first()), "arguments");
    }

    void callToAnAbsentServiceFails()
    {
        BusClient client;
        Proxies proxies(QStringLiteral("org.example.service"), path, client.bus());
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
        const QString service = QStringLiteral("org.example.service");
        BusClient client;
        Proxies proxies(service, path, client.bus());
        const RecordedService server(QDBusConnection::SessionBus, service, answerWith(300));

        QCOMPARE(proxies.velkg.GetPolicyPullTime().value(), 300);
        proxies.pryg.PullAndExeSysPolicy().waitForFinished();
        proxies.prys.onPolicyMsg(QStringLiteral("{}")).waitForFinished();

        QCOMPARE(server.calls().size(), 3);
    }
};

QTEST_GUILESS_MAIN(DBusClassesTest)
#include "dbus_classes_test.moc"
