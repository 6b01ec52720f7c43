#include <QDBusPendingReply>
#include <QRegularExpression>
#include <QTest>

#include <functional>

#include "bus_client.h"
#include "proxies.h"
#include "pryg_adapter.h"
#include "prys_adapter.h"
#include "velkg_adapter.h"

namespace {

const QString path = QStringLiteral("/org/example/object");
const QString velkg = QStringLiteral("com.norix.velk.velkg");
const QString pryg = QStringLiteral("com.norix.velk.pryg");
const QString prys = QStringLiteral("com.norix.velk.prys");

} // namespace

/// Has every method and signal of the three interfaces, and records the calls as lists of method and
/// arguments.
class Implementation : public QObject
{
    Q_OBJECT

public:
    QList<QVariantList> calls;

public Q_SLOTS:
    int GetDomainStatus() { return record({QStringLiteral("GetDomainStatus")}), 11; }
    QString GetMachineID() { return record({QStringLiteral("GetMachineID")}), QStringLiteral("机器"); }
    int GetNetStatus() { return record({QStringLiteral("GetNetStatus")}), 12; }
    int GetPolicyPullTime() { return record({QStringLiteral("GetPolicyPullTime")}), 13; }
    QString GetServerIP() { return record({QStringLiteral("GetServerIP")}), QStringLiteral("::1"); }
    QString GetServerPort() { return record({QStringLiteral("GetServerPort")}), QStringLiteral("443"); }
    void SendUserStatus(int type, const QString& userName)
    {
        record({QStringLiteral("SendUserStatus"), type, userName});
    }
    void UpdateUserInfo(const QString& name, int id) { record({QStringLiteral("UpdateUserInfo"), name, id}); }
    int onDomainConfig(const QString& type) { return record({QStringLiteral("onDomainConfig"), type}), -14; }
    void onPolicyFinished(int taskID, int jobID, int code, const QString& ack)
    {
        record({QStringLiteral("onPolicyFinished"), taskID, jobID, code, ack});
    }
    void onUploadFinished(const QString& url, const QString& data)
    {
        record({QStringLiteral("onUploadFinished"), url, data});
    }
    void sendAppOpenState(int type, const QString& appName)
    {
        record({QStringLiteral("sendAppOpenState"), type, appName});
    }
    void PullAndExeSysPolicy() { record({QStringLiteral("PullAndExeSysPolicy")}); }
    void onPolicyMsg(const QString& payload) { record({QStringLiteral("onPolicyMsg"), payload}); }

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
    void record(const QVariantList& call) { calls << call; }
};

using Emit = std::function<void(Implementation&)>;
Q_DECLARE_METATYPE(Emit)

namespace {

/// Puts the object on the bus with the three adapters.
void exportObject(BusClient& server, QObject& object)
{
    new velkgAdapter(&object);
    new prygAdapter(&object);
    new prysAdapter(&object);
    QVERIFY(server.bus().registerObject(path, &object, QDBusConnection::ExportAdaptors));
}

QDBusMessage callOf(const BusClient& server, const QString& interface, const QString& method,
                    const QVariantList& arguments)
{
    QDBusMessage call = QDBusMessage::createMethodCall(server.uniqueName(), path, interface, method);
    call.setArguments(arguments);
    return call;
}

void addMethod(const QString& interface, const char* method, const QVariantList& arguments,
               const QVariantList& reply, const QVariantList& emptyReply)
{
    QTest::addRow("%s.%s", qPrintable(interface), method)
        << interface << QString::fromLatin1(method) << arguments << reply << emptyReply;
}

void addMethods()
{
    QTest::addColumn<QString>("interface");
    QTest::addColumn<QString>("method");
    QTest::addColumn<QVariantList>("arguments");
    QTest::addColumn<QVariantList>("reply");
    QTest::addColumn<QVariantList>("emptyReply");

    const QString text = QStringLiteral("策略");
    const QString other = QStringLiteral("other");
    const QVariantList noText = {QString()};
    addMethod(velkg, "GetDomainStatus", {}, {11}, {0});
    addMethod(velkg, "GetMachineID", {}, {QStringLiteral("机器")}, noText);
    addMethod(velkg, "GetNetStatus", {}, {12}, {0});
    addMethod(velkg, "GetPolicyPullTime", {}, {13}, {0});
    addMethod(velkg, "GetServerIP", {}, {QStringLiteral("::1")}, noText);
    addMethod(velkg, "GetServerPort", {}, {QStringLiteral("443")}, noText);
    addMethod(velkg, "SendUserStatus", {1, text}, {}, {});
    addMethod(velkg, "UpdateUserInfo", {text, 10001}, {}, {});
    addMethod(velkg, "onDomainConfig", {text}, {-14}, {0});
    addMethod(velkg, "onPolicyFinished", {1, 2, 3, text}, {}, {});
    addMethod(velkg, "onUploadFinished", {text, other}, {}, {});
    addMethod(velkg, "sendAppOpenState", {2, text}, {}, {});
    addMethod(pryg, "PullAndExeSysPolicy", {}, {}, {});
    addMethod(pryg, "onPolicyMsg", {text}, {}, {});
    addMethod(prys, "onPolicyMsg", {text}, {}, {});
}

void addSignal(const QString& interface, const char* name, const QVariantList& arguments, const Emit& emitIt)
{
    QTest::addRow("%s.%s", qPrintable(interface), name)
        << interface << QString::fromLatin1(name) << arguments << emitIt;
}

} // namespace

/// Objects exported through the adapters, seen from another connection of a real bus.
class DBusAdaptersTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void callReachesTheParentAndItsReplyTheCaller_data() { addMethods(); }
    void callReachesTheParentAndItsReplyTheCaller()
    {
        QFETCH(const QString, interface);
        QFETCH(const QString, method);
        QFETCH(const QVariantList, arguments);
        QFETCH(const QVariantList, reply);
        BusClient server;
        Implementation implementation;
        exportObject(server, implementation);
        BusClient client;

        const QDBusPendingCall call = client.bus().asyncCall(callOf(server, interface, method, arguments));
        QVERIFY(finished(call));

        QVERIFY2(!call.isError(), qPrintable(call.error().message()));
        QCOMPARE(call.reply().arguments(), reply);
        QCOMPARE(implementation.calls, QList<QVariantList>{QVariantList{method} + arguments});
    }

    void parentWithoutTheMethodRepliesEmpty_data() { addMethods(); }
    void parentWithoutTheMethodRepliesEmpty()
    {
        QFETCH(const QString, interface);
        QFETCH(const QString, method);
        QFETCH(const QVariantList, arguments);
        QFETCH(const QVariantList, emptyReply);
        BusClient server;
        QObject bare;
        exportObject(server, bare);
        BusClient client;
        QTest::ignoreMessage(QtWarningMsg, QRegularExpression(QStringLiteral("No such method.*") + method));

        const QDBusPendingCall call = client.bus().asyncCall(callOf(server, interface, method, arguments));
        QVERIFY(finished(call));

        QVERIFY2(!call.isError(), qPrintable(call.error().message()));
        QCOMPARE(call.reply().arguments(), emptyReply);
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
        QFETCH(const QVariantList, arguments);
        QFETCH(const Emit, emitIt);
        BusClient server;
        Implementation implementation;
        exportObject(server, implementation);
        BusClient client;
        Proxies proxies(server.uniqueName(), path, client.bus());
        QSignalSpy received(&proxies.of(interface), signalNamed(proxies.of(interface), name));
        client.settle();

        emitIt(implementation);
        server.deliverTo(client);

        QCOMPARE(received.size(), 1);
        QCOMPARE(received.first(), arguments);
    }
};

QTEST_GUILESS_MAIN(DBusAdaptersTest)
#include "dbus_adapters_test.moc"
