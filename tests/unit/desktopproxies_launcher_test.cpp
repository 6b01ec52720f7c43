#include <QDBusMetaType>
#include <QTest>

#include <limits>

#include "bus_client.h"
#include "launcherd.h"
#include "recorded_service.h"

namespace {

const QString service = QStringLiteral("com.norix.kpx.daemon.Launcher");
const QString path = QStringLiteral("/com/norix/kpx/daemon/Launcher");

LauncherItemInfo item()
{
    return {QStringLiteral("/usr/share/applications/editor.desktop"),
            QStringLiteral("文本编辑器"),
            QStringLiteral("editor"),
            QStringLiteral("icon"),
            std::numeric_limits<qint64>::min(),
            std::numeric_limits<qint64>::max()};
}

QVariantList fieldsOf(const LauncherItemInfo& info)
{
    return {info.path, info.name, info.firstDetail, info.secondDetail, info.firstNumber, info.secondNumber};
}

} // namespace

/// The launcher and its types, as seen by its proxy on a real bus.
class DesktopProxiesLauncherTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        registerLauncherItemInfoMetaType();
        registerLauncherItemInfoListMetaType();
    }

    void typesAreKnownByName()
    {
        QCOMPARE(QMetaType::type("LauncherItemInfo"), qMetaTypeId<LauncherItemInfo>());
        QCOMPARE(QMetaType::type("LauncherItemInfoList"), qMetaTypeId<LauncherItemInfoList>());
        QCOMPARE(QMetaType::typeName(qMetaTypeId<LauncherItemInfo>()), "LauncherItemInfo");
        QCOMPARE(QMetaType::typeName(qMetaTypeId<LauncherItemInfoList>()), "LauncherItemInfoList");
    }

    void registeringAgainChangesNothing()
    {
        const int itemType = QMetaType::type("LauncherItemInfo");
        const int listType = QMetaType::type("LauncherItemInfoList");

        registerLauncherItemInfoMetaType();
        registerLauncherItemInfoListMetaType();

        QCOMPARE(QMetaType::type("LauncherItemInfo"), itemType);
        QCOMPARE(QMetaType::type("LauncherItemInfoList"), listType);
    }

    void signaturesAreTheLaunchers()
    {
        QCOMPARE(QDBusMetaType::typeToSignature(qMetaTypeId<LauncherItemInfo>()), "(ssssxx)");
        QCOMPARE(QDBusMetaType::typeToSignature(qMetaTypeId<LauncherItemInfoList>()), "a(ssssxx)");
    }

    void itemGoesOverTheWireInTheOrderOfItsFields()
    {
        const RecordedService receiver(QDBusConnection::SessionBus, service, answerNothing);
        auto call = QDBusMessage::createMethodCall(service, path, service, QStringLiteral("Take"));
        call << QVariant::fromValue(item());
        QDBusConnection::sessionBus().call(call);
        const QDBusMessage received = receiver.calls().value(0);
        QCOMPARE(received.signature(), QStringLiteral("(ssssxx)"));

        const auto argument = received.arguments().first().value<QDBusArgument>();
        QVariantList fields;
        argument.beginStructure();
        while (!argument.atEnd()) {
            fields << argument.asVariant();
        }
        argument.endStructure();
        QCOMPARE(fields, fieldsOf(item()));
    }

    void itemsComeWholeAndInTheLaunchersOrder_data()
    {
        QTest::addColumn<LauncherItemInfoList>("items");
        QTest::newRow("none") << LauncherItemInfoList{};
        QTest::newRow("one") << LauncherItemInfoList{item()};
        QTest::newRow("several") << LauncherItemInfoList{{}, item(), {}};
    }

    void itemsComeWholeAndInTheLaunchersOrder()
    {
        QFETCH(const LauncherItemInfoList, items);
        const RecordedService launcher(QDBusConnection::SessionBus, service,
                                       answerWith(QVariant::fromValue(items)));
        BusClient agent;
        __Launcherd proxy(service, path, agent.bus());
        QVERIFY(proxy.isValid());

        const LauncherItemInfoList received = proxy.GetAllItemInfos().value();

        QCOMPARE(received.size(), items.size());
        for (int i = 0; i < items.size(); ++i) {
            QCOMPARE(fieldsOf(received.at(i)), fieldsOf(items.at(i)));
        }
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
        QCOMPARE(fieldsOf(changed.first().value(1).value<LauncherItemInfo>()), fieldsOf(item()));
        QCOMPARE(changed.first().value(2).toLongLong(), 7);
    }
};

QTEST_GUILESS_MAIN(DesktopProxiesLauncherTest)
#include "desktopproxies_launcher_test.moc"
