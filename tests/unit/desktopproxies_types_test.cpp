#include <QDBusMetaType>
#include <QDBusPendingReply>
#include <QTest>

#include <limits>

#include "recorded_service.h"
#include "types.h"

namespace {

const QString service = QStringLiteral("org.example.launcher");

QVariantList fieldsOf(const LauncherItemInfo& info)
{
    return {info.path, info.name, info.firstDetail, info.secondDetail, info.firstNumber, info.secondNumber};
}

LauncherItemInfo item()
{
    return {QStringLiteral("/usr/share/applications/editor.desktop"),
            QStringLiteral("文本编辑器"),
            QStringLiteral("editor"),
            QStringLiteral("icon"),
            std::numeric_limits<qint64>::min(),
            std::numeric_limits<qint64>::max()};
}

LauncherItemInfo emptyItem()
{
    return {};
}

/// Sends the argument over the session bus and returns the message as it came in at the other end.
QDBusMessage sentOverTheBus(const QVariant& argument)
{
    const RecordedService receiver(QDBusConnection::SessionBus, service, answerNothing);
    QDBusMessage call =
        QDBusMessage::createMethodCall(service, QStringLiteral("/"), service, QStringLiteral("Take"));
    call << argument;
    QDBusConnection::sessionBus().call(call);
    return receiver.calls().value(0);
}

LauncherItemInfoList listOverTheBus(const LauncherItemInfoList& list)
{
    const QDBusMessage received = sentOverTheBus(QVariant::fromValue(list));
    return qdbus_cast<LauncherItemInfoList>(received.arguments().value(0));
}

} // namespace

/// The launcher's item types as they go over a real bus.
class DesktopProxiesTypesTest : public QObject
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
        const QDBusMessage received = sentOverTheBus(QVariant::fromValue(item()));
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

    void itemComesBackWhole()
    {
        const QDBusMessage received = sentOverTheBus(QVariant::fromValue(item()));
        QCOMPARE(fieldsOf(qdbus_cast<LauncherItemInfo>(received.arguments().value(0))), fieldsOf(item()));
    }

    void listComesBackWhole_data()
    {
        QTest::addColumn<LauncherItemInfoList>("list");
        QTest::newRow("empty") << LauncherItemInfoList{};
        QTest::newRow("one") << LauncherItemInfoList{item()};
        QTest::newRow("several") << LauncherItemInfoList{emptyItem(), item(), emptyItem()};
    }

    void listComesBackWhole()
    {
        QFETCH(const LauncherItemInfoList, list);
        const LauncherItemInfoList back = listOverTheBus(list);

        QCOMPARE(back.size(), list.size());
        for (int i = 0; i < list.size(); ++i) {
            QCOMPARE(fieldsOf(back.at(i)), fieldsOf(list.at(i)));
        }
    }

    void replyWithAListIsRead()
    {
        const LauncherItemInfoList items = {item(), emptyItem()};
        const RecordedService launcher(QDBusConnection::SessionBus, service,
                                       answerWith(QVariant::fromValue(items)));

        const QDBusPendingReply<LauncherItemInfoList> reply = QDBusConnection::sessionBus().asyncCall(
            QDBusMessage::createMethodCall(service, QStringLiteral("/"), service, QStringLiteral("List")));
        const LauncherItemInfoList received = reply.value();

        QVERIFY2(!reply.isError(), qPrintable(reply.error().message()));
        QCOMPARE(received.size(), 2);
        QCOMPARE(fieldsOf(received.first()), fieldsOf(item()));
    }
};

QTEST_GUILESS_MAIN(DesktopProxiesTypesTest)
#include "desktopproxies_types_test.moc"
