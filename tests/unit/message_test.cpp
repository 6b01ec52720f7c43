#include <QJsonDocument>
#include <QtTest>

#include "files.h"
#include "message.h"

using namespace velk::module::message;

namespace {

QByteArray compact(const QJsonObject& object)
{
    return QJsonDocument(object).toJson(QJsonDocument::Compact);
}

QJsonObject contractExample(const QString& schema, const QString& name)
{
    const QString path = QStringLiteral(VELK_SOURCE_DIR "/contracts/json/examples/%1/%2.json");
    QFile file(path.arg(schema, name));
    if (!file.open(QIODevice::ReadOnly)) {
        qFatal("cannot read %s", qUtf8Printable(file.fileName()));
    }
    return QJsonDocument::fromJson(file.readAll()).object();
}

SystemInfoPlayload wholeSystem()
{
    SystemInfoPlayload system;
    system.active_state = 1;
    system.developer_mode = 2;
    system.name = QStringLiteral("终端一");
    system.machine_id = QStringLiteral("m1");
    system.sn = QStringLiteral("s1");
    system.old_machine_id = QStringLiteral("m0");
    system.os = QStringLiteral("desktop");
    system.arch = QStringLiteral("amd64");
    system.version = QStringLiteral("20");
    system.client_version = QStringLiteral("1.2");
    system.host_name = QStringLiteral("pc");
    system.product_name = QStringLiteral("box");
    system.platform = QStringLiteral("x86");
    system.need_upgrade = true;
    system.mainboard = to_json(MainboardPlayload{QStringLiteral("b"), QStringLiteral("board")});
    system.cpu_list = {to_json(CPUPlayload{QStringLiteral("c"), QStringLiteral("cpu")})};
    system.disk_list = {to_json(DiskPlayload{QStringLiteral("d"), QStringLiteral("disk"), 512}),
                        to_json(DiskPlayload{QStringLiteral("e"), QStringLiteral("disk"), 0})};
    system.memory_list = {to_json(MemoryPlayload{QStringLiteral("r"), QStringLiteral("ram"), 16})};
    system.graphisc_list = {to_json(GraphiscPlayload{QStringLiteral("g"), QStringLiteral("gpu")})};
    system.network_device_list = {to_json(NetworkDevicePlayload{
        QStringLiteral("00:1A:2B:3C:4D:5E"), QStringLiteral("net"), QStringLiteral("10.0.0.5")})};
    return system;
}

} // namespace

class MessageTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void recordIsWrittenWithItsKeysInAlphabeticalOrder_data()
    {
        QTest::addColumn<QJsonObject>("object");
        QTest::addColumn<QByteArray>("text");

        const QString sn = QStringLiteral("s");
        const QString model = QStringLiteral("m");
        const QByteArray part(R"({"model":"m","sn":"s"})");
        const QByteArray partWithCapacity(R"({"cap":7,"model":"m","sn":"s"})");

        QTest::newRow("message") << to_json(Message{5, 2002, {{QStringLiteral("key"), 1}}})
                                 << QByteArray(R"({"id":5,"payload":{"key":1},"type":2002})");
        QTest::newRow("task")
            << to_json(TaskBody{3,
                                QStringLiteral("s.sh"),
                                QStringLiteral("bash"),
                                {QStringLiteral("A=1")},
                                {QStringLiteral("-x")}})
            << QByteArray(R"({"args":["-x"],"env":["A=1"],"program":"bash","script":"s.sh","type":3})");
        QTest::newRow("network device")
            << to_json(NetworkDevicePlayload{QStringLiteral("00:1A"), model, QStringLiteral("10.0.0.5")})
            << QByteArray(R"({"ip_address":"10.0.0.5","mac":"00:1A","model":"m"})");
        QTest::newRow("CPU") << to_json(CPUPlayload{sn, model}) << part;
        QTest::newRow("disk") << to_json(DiskPlayload{sn, model, 7}) << partWithCapacity;
        QTest::newRow("memory") << to_json(MemoryPlayload{sn, model, 7}) << partWithCapacity;
        QTest::newRow("mainboard") << to_json(MainboardPlayload{sn, model}) << part;
        QTest::newRow("graphics") << to_json(GraphiscPlayload{sn, model}) << part;
    }

    void recordIsWrittenWithItsKeysInAlphabeticalOrder()
    {
        QFETCH(QJsonObject, object);
        QTEST(compact(object), "text");
    }

    void defaultRecordHasEveryKeyAndIsTheContractsExample_data()
    {
        QTest::addColumn<QJsonObject>("object");

        QTest::newRow("upload-message") << to_json(Message{});
        QTest::newRow("upload-task-body") << to_json(TaskBody{});
        QTest::newRow("upload-network-device") << to_json(NetworkDevicePlayload{});
        QTest::newRow("upload-cpu") << to_json(CPUPlayload{});
        QTest::newRow("upload-disk") << to_json(DiskPlayload{});
        QTest::newRow("upload-memory") << to_json(MemoryPlayload{});
        QTest::newRow("upload-mainboard") << to_json(MainboardPlayload{});
        QTest::newRow("upload-graphisc") << to_json(GraphiscPlayload{});
        QTest::newRow("upload-system-info") << to_json(SystemInfoPlayload{});
    }

    void defaultRecordHasEveryKeyAndIsTheContractsExample()
    {
        QFETCH(QJsonObject, object);
        const auto schema = QString::fromLatin1(QTest::currentDataTag());
        QCOMPARE(compact(object), compact(contractExample(schema, QStringLiteral("valid-default"))));
    }

    void listsKeepTheirOrderAndRepetitions()
    {
        TaskBody task;
        task.env = QStringList{QStringLiteral("B=2"), QStringLiteral("A=1"), QStringLiteral("B=2")};
        task.args = QStringList{QStringLiteral("--"), QString(), QStringLiteral("a b")};
        QCOMPARE(compact(to_json(task)),
                 QByteArray(R"({"args":["--","","a b"],"env":["B=2","A=1","B=2"],)"
                            R"("program":"","script":"","type":0})"));
    }

    void textsOfAllKindsAreWrittenAsTheyAre_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QByteArray>("written");

        QTest::newRow("Chinese") << QStringLiteral("中央处理器") << QByteArray("\"中央处理器\"");
        QTest::newRow("beyond the basic plane") << QStringLiteral("盘😀") << QByteArray("\"盘😀\"");
        // moc loses the class after a raw string with an escaped quote.
        // NOLINTBEGIN(modernize-raw-string-literal)
        QTest::newRow("quotes and backslash")
            << QStringLiteral(R"(a "b" \c)") << QByteArray("\"a \\\"b\\\" \\\\c\"");
        // NOLINTEND(modernize-raw-string-literal)
        QTest::newRow("line break and tab") << QStringLiteral("a\n\tb") << QByteArray(R"("a\n\tb")");
        QTest::newRow("control character") << QStringLiteral("a\u0001b") << QByteArray(R"("a\u0001b")");
        QTest::newRow("blanks") << QStringLiteral("  a ") << QByteArray("\"  a \"");
        QTest::newRow("no text at all") << QString() << QByteArray("\"\"");
    }

    void textsOfAllKindsAreWrittenAsTheyAre()
    {
        QFETCH(QString, text);
        QFETCH(QByteArray, written);
        QCOMPARE(compact(to_json(CPUPlayload{text, text})),
                 QByteArray("{\"model\":" + written + ",\"sn\":" + written + "}"));
    }

    void capacityIsExact_data()
    {
        QTest::addColumn<qint64>("capacity");
        QTest::addColumn<QByteArray>("written");

        QTest::newRow("nothing") << Q_INT64_C(0) << QByteArray("0");
        QTest::newRow("one") << Q_INT64_C(1) << QByteArray("1");
        QTest::newRow("unknown") << Q_INT64_C(-1) << QByteArray("-1");
        QTest::newRow("beyond 32 bits") << Q_INT64_C(4294967297) << QByteArray("4294967297");
        QTest::newRow("2 TB") << Q_INT64_C(2000398934016) << QByteArray("2000398934016");
        QTest::newRow("2^53 - 1") << Q_INT64_C(9007199254740991) << QByteArray("9007199254740991");
        QTest::newRow("2^53") << Q_INT64_C(9007199254740992) << QByteArray("9007199254740992");
    }

    void capacityIsExact()
    {
        QFETCH(qint64, capacity);
        QFETCH(QByteArray, written);
        const QByteArray text = R"({"cap":)" + written + R"(,"model":"","sn":""})";
        QCOMPARE(compact(to_json(DiskPlayload{QString(), QString(), capacity})), text);
        QCOMPARE(compact(to_json(MemoryPlayload{QString(), QString(), capacity})), text);
    }

    void numbersReachTheirLimits()
    {
        const qint32 least = std::numeric_limits<qint32>::min();
        const qint32 most = std::numeric_limits<qint32>::max();
        QCOMPARE(compact(to_json(Message{least, most, {}})),
                 QByteArray(R"({"id":-2147483648,"payload":{},"type":2147483647})"));
    }

    void partsOfTheSystemAreNestedAsTheyWereBuilt()
    {
        const QJsonObject system = to_json(wholeSystem());
        QCOMPARE(system.value(QLatin1String("disk_list")).toArray().size(), 2);
        QCOMPARE(compact(to_json(Message{1, 2, system})),
                 QByteArray("{\"id\":1,\"payload\":" + compact(system) + ",\"type\":2}"));
        QCOMPARE(
            compact(system),
            compact(contractExample(QStringLiteral("upload-system-info"), QStringLiteral("valid-whole"))));
    }
};

QTEST_GUILESS_MAIN(MessageTest)
#include "message_test.moc"
