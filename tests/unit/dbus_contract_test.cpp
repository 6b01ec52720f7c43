#include <QDBusMetaType>
#include <QDBusPendingReply>
#include <QFile>
#include <QMetaMethod>
#include <QTest>
#include <QXmlStreamReader>

#include <algorithm>
#include <functional>

#include "bus_client.h"
#include "pryg_adapter.h"
#include "pryg_interface.h"
#include "prys_adapter.h"
#include "prys_interface.h"
#include "velkg_adapter.h"
#include "velkg_interface.h"

/// The two classes of one interface.
struct Contract
{
    QString interface;
    const QMetaObject* adapter = nullptr;
    const QMetaObject* proxy = nullptr;
    QString adapterName;
    QString proxyName;
    std::function<void(QObject*)> exportFrom;
};
Q_DECLARE_METATYPE(Contract)

namespace {

template <typename Adapter, typename Proxy> void addRow(const char* name)
{
    const QString interface = QStringLiteral("com.norix.velk.") + QLatin1String(name);
    QTest::newRow(name) << Contract{interface,
                                    &Adapter::staticMetaObject,
                                    &Proxy::staticMetaObject,
                                    QLatin1String(Adapter::staticInterfaceName()),
                                    QLatin1String(Proxy::staticInterfaceName()),
                                    [](QObject* parent) { new Adapter(parent); }};
}

/// One member as a line to compare and to read, such as "method onDomainConfig in[s type] out[i]".
QString memberLine(const QString& kind, const QString& name, const QStringList& ins, const QStringList& outs)
{
    return QStringLiteral("%1 %2 in[%3] out[%4]")
        .arg(kind, name, ins.join(QStringLiteral(", ")), outs.join(QStringLiteral(", ")));
}

QString attribute(const QXmlStreamReader& xml, const char* name)
{
    return xml.attributes().value(QLatin1String(name)).toString();
}

/// Reads one member element; any child that is no argument shows up among the outgoing ones.
QString readMember(QXmlStreamReader& xml)
{
    const QString kind = xml.name().toString();
    const QString name = attribute(xml, "name");
    QStringList ins;
    QStringList outs;
    while (xml.readNextStartElement()) {
        const bool isArgument = xml.name() == QLatin1String("arg");
        const QString type = isArgument ? attribute(xml, "type") : xml.name().toString();
        const QString direction = attribute(xml, "direction");
        QStringList& list = direction == QLatin1String("in") ? ins : outs;
        list << QStringLiteral("%1 %2").arg(type, attribute(xml, "name")).trimmed();
        xml.skipCurrentElement();
    }
    return memberLine(kind, name, ins, outs);
}

/// The members of the interface in the order of the document; the error's text for a document that is broken.
QStringList membersOf(const QByteArray& document, const QString& interface)
{
    QXmlStreamReader xml(document);
    QStringList members;
    xml.readNextStartElement();
    while (xml.readNextStartElement()) {
        if (attribute(xml, "name") != interface) {
            xml.skipCurrentElement();
            continue;
        }
        while (xml.readNextStartElement()) {
            members << readMember(xml);
        }
    }
    return xml.hasError() ? QStringList{xml.errorString()} : members;
}

QString elementLine(const QXmlStreamReader& xml)
{
    return QStringLiteral("%1 %2").arg(xml.name(), attribute(xml, "name")).trimmed();
}

/// The root element and those right below it, with their names; the error's text for a document that is
/// broken.
QStringList topElementsOf(const QByteArray& document)
{
    QXmlStreamReader xml(document);
    QStringList elements;
    xml.readNextStartElement();
    elements << elementLine(xml);
    while (xml.readNextStartElement()) {
        elements << elementLine(xml);
        xml.skipCurrentElement();
    }
    return xml.hasError() ? QStringList{xml.errorString()} : elements;
}

QByteArray documentOf(const QString& interface)
{
    QFile file(QStringLiteral(VELK_SOURCE_DIR "/src/velk/dbus/%1.xml").arg(interface));
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

QStringList membersOfFile(const QString& interface)
{
    return membersOf(documentOf(interface), interface);
}

/// The D-Bus signature of a C++ type: empty for nothing, "?" for a type that D-Bus does not know.
QString wireType(QByteArray type)
{
    const QByteArray pendingReply = "QDBusPendingReply<";
    if (type.startsWith(pendingReply)) {
        type = type.mid(pendingReply.size()).chopped(1);
    }
    if (type.isEmpty() || type == "void") {
        return {};
    }
    const char* signature = QDBusMetaType::typeToSignature(QMetaType::type(type));
    return signature == nullptr ? QStringLiteral("?") : QString::fromLatin1(signature);
}

QString memberLine(const QMetaMethod& method)
{
    QStringList arguments;
    for (int i = 0; i < method.parameterCount(); ++i) {
        arguments << wireType(method.parameterTypes().at(i)) + QLatin1Char(' ')
                + QString::fromLatin1(method.parameterNames().at(i));
    }
    const QString name = QString::fromLatin1(method.name());
    if (method.methodType() == QMetaMethod::Signal) {
        return memberLine(QStringLiteral("signal"), name, {}, arguments);
    }
    const QString reply = wireType(method.typeName());
    return memberLine(QStringLiteral("method"), name, arguments,
                      reply.isEmpty() ? QStringList() : QStringList{reply});
}

QStringList membersOf(const QMetaObject& meta)
{
    QStringList members;
    for (int i = meta.methodOffset(); i < meta.methodCount(); ++i) {
        members << memberLine(meta.method(i));
    }
    return members;
}

/// The order in which both classes declare the members: signals, then slots, each by name, capitals first.
QStringList inClassOrder(const QStringList& members)
{
    QStringList sorted = members;
    std::sort(sorted.begin(), sorted.end(), [](const QString& left, const QString& right) {
        const QString first = QStringLiteral("signal");
        const bool leftIsSignal = left.startsWith(first);
        return leftIsSignal != right.startsWith(first) ? leftIsSignal : left < right;
    });
    return sorted;
}

/// The class's own class information of that name; empty when it has none.
QByteArray classInformation(const QMetaObject& meta, const char* name)
{
    const int index = meta.indexOfClassInfo(name);
    return index < meta.classInfoOffset() ? QByteArray() : QByteArray(meta.classInfo(index).value());
}

QStringList membersOfClassInformation(const QMetaObject& meta, const QString& interface)
{
    return membersOf("<node>" + classInformation(meta, "D-Bus Introspection") + "</node>", interface);
}

/// Fails the test and names what is missing, or too much.
void compareMembers(const QStringList& actual, const QStringList& expected)
{
    QStringList complaints;
    for (const QString& member : expected) {
        if (!actual.contains(member)) {
            complaints << QStringLiteral("lacks ") + member;
        }
    }
    for (const QString& member : actual) {
        if (!expected.contains(member)) {
            complaints << QStringLiteral("has also ") + member;
        }
    }
    QVERIFY2(complaints.isEmpty(), qPrintable(complaints.join(QStringLiteral("; "))));
    QCOMPARE(actual, expected); // their order
}

} // namespace

class DBusContractTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    /// Every test is made for each of the three.
    void initTestCase_data()
    {
        QTest::addColumn<Contract>("contract");
        addRow<velkgAdapter, velkgInterface>("velkg");
        addRow<prygAdapter, prygInterface>("pryg");
        addRow<prysAdapter, prysInterface>("prys");
    }

    void fileDeclaresThisInterfaceAlone()
    {
        QFETCH_GLOBAL(const Contract, contract);
        QCOMPARE(topElementsOf(documentOf(contract.interface)),
                 QStringList({QStringLiteral("node"), QStringLiteral("interface ") + contract.interface}));
    }

    void classesNameTheInterface()
    {
        QFETCH_GLOBAL(const Contract, contract);
        QCOMPARE(contract.adapterName, contract.interface);
        QCOMPARE(contract.proxyName, contract.interface);
        QCOMPARE(classInformation(*contract.adapter, "D-Bus Interface"), contract.interface.toLatin1());
        QCOMPARE(classInformation(*contract.proxy, "D-Bus Interface"), contract.interface.toLatin1());
    }

    void proxyCarriesTheIntrospectionText()
    {
        QFETCH_GLOBAL(const Contract, contract);
        compareMembers(membersOfClassInformation(*contract.proxy, contract.interface),
                       membersOfFile(contract.interface));
    }

    void exportedAdapterIntrospectsAsTheFile()
    {
        QFETCH_GLOBAL(const Contract, contract);
        BusClient exporter;
        QObject object;
        contract.exportFrom(&object);
        const QString path = QStringLiteral("/exported");
        QVERIFY(exporter.bus().registerObject(path, &object, QDBusConnection::ExportAdaptors));

        BusClient client;
        const QDBusPendingReply<QString> reply = client.bus().asyncCall(QDBusMessage::createMethodCall(
            exporter.uniqueName(), path, QStringLiteral("org.freedesktop.DBus.Introspectable"),
            QStringLiteral("Introspect")));
        QVERIFY(finished(reply));
        QVERIFY2(reply.isValid(), qPrintable(reply.error().message()));
        compareMembers(membersOf(reply.value().toUtf8(), contract.interface),
                       membersOfFile(contract.interface));
    }

    void adapterDeclaresTheMembers()
    {
        QFETCH_GLOBAL(const Contract, contract);
        compareMembers(membersOf(*contract.adapter), inClassOrder(membersOfFile(contract.interface)));
    }

    void proxyDeclaresTheMembers()
    {
        QFETCH_GLOBAL(const Contract, contract);
        compareMembers(membersOf(*contract.proxy), inClassOrder(membersOfFile(contract.interface)));
    }
};

QTEST_GUILESS_MAIN(DBusContractTest)
#include "dbus_contract_test.moc"
