#include <QDBusMetaType>
#include <QTest>

#include "bus_client.h"
#include "entry.h"
#include "property_service.h"

namespace {

const QString service = QStringLiteral("com.norix.kpx.daemon.Dock");
const QString path = QStringLiteral("/com/norix/kpx/daemon/Dock/entries/e0T1");
const QString interface = QStringLiteral("com.norix.kpx.daemon.Dock.Entry");
const QString name = QStringLiteral("Name");
const QString windowInfos = QStringLiteral("WindowInfos");

using TextMap = QMap<uint, QString>;
using BoxedMap = QMap<uint, QDBusVariant>;
using StructMap = QMap<uint, LauncherItemInfo>;
using NestedMap = QMap<uint, QVariantMap>;
using ForeignMap = QMap<QString, uint>;

/// A map of that many windows.
QVariant windows(uint count)
{
    TextMap map;
    for (uint window = 1; window <= count; ++window) {
        map.insert(window, QStringLiteral("title"));
    }
    return QVariant::fromValue(map);
}

QDBusMessage propertiesChanged(const QVariantMap& changed, const QStringList& invalidated = {},
                               const QString& of = interface)
{
    return signalOf(path, QStringLiteral("org.freedesktop.DBus.Properties"), "PropertiesChanged",
                    {of, changed, invalidated});
}

} // namespace

/// One dock entry, as seen by its proxy on a real bus.
class DesktopProxiesEntryTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        qRegisterMetaType<WindowInfoMap>("QMap<uint,WindowInfo>");
        qDBusRegisterMetaType<TextMap>();
        qDBusRegisterMetaType<BoxedMap>();
        qDBusRegisterMetaType<NestedMap>();
        qDBusRegisterMetaType<ForeignMap>();
        registerLauncherItemInfoMetaType();
        qDBusRegisterMetaType<StructMap>();
    }

    void init()
    {
        m_dock = std::make_unique<PropertyService>(service);
        m_dock->set(path, QStringLiteral("Id"), QStringLiteral("e0T1"));
        m_dock->set(path, name, QStringLiteral("编辑器"));
        m_dock->set(path, QStringLiteral("IsDocked"), true);
        m_dock->set(path, windowInfos, windows(2));
        m_agent = std::make_unique<BusClient>();
        m_entry = std::make_unique<__Entry>(service, path, m_agent->bus());
        m_names = std::make_unique<QSignalSpy>(m_entry.get(), &__Entry::NameChanged);
        m_windows = std::make_unique<QSignalSpy>(m_entry.get(), &__Entry::WindowInfosChanged);
    }

    void cleanup()
    {
        m_windows.reset();
        m_names.reset();
        m_entry.reset();
        m_agent.reset();
        m_dock.reset();
    }

    void entryIsReadAsTheDockHasIt()
    {
        QVERIFY(m_entry->isValid());
        QCOMPARE(m_entry->id(), QStringLiteral("e0T1"));
        QCOMPARE(m_entry->name(), QStringLiteral("编辑器"));
        QVERIFY(m_entry->isDocked());
        QCOMPARE(m_entry->windowInfos().keys(), (QList<uint>{1, 2}));

        m_dock->set(path, QStringLiteral("IsDocked"), false);
        QVERIFY(!m_entry->isDocked());
    }

    void eachWindowMapIsCounted_data()
    {
        QTest::addColumn<QVariant>("map");
        QTest::addColumn<QList<uint>>("expected");
        const QDBusVariant boxed(QStringLiteral("any"));
        const QList<uint> both{1, 4294967295};
        QTest::newRow("none") << QVariant::fromValue(TextMap()) << QList<uint>();
        QTest::newRow("texts") << QVariant::fromValue(TextMap{{1, {}}, {4294967295, {}}}) << both;
        QTest::newRow("variants") << QVariant::fromValue(BoxedMap{{1, boxed}, {4294967295, boxed}}) << both;
        QTest::newRow("structures") << QVariant::fromValue(StructMap{{1, {}}, {4294967295, {}}}) << both;
        QTest::newRow("maps") << QVariant::fromValue(
            NestedMap{{1, {}}, {4294967295, {{QStringLiteral("a"), 1}}}})
                              << both;
    }

    void eachWindowMapIsCounted()
    {
        QFETCH(QVariant, map);
        m_dock->set(path, windowInfos, map);
        QTEST(m_entry->windowInfos().keys(), "expected");
    }

    void otherTypesReadAsEmpty()
    {
        for (const QVariant& value : {QVariant(7), QVariant(QStringList{QStringLiteral("a")}),
                                      QVariant::fromValue(ForeignMap{{QStringLiteral("a"), 1}}),
                                      QVariant::fromValue(LauncherItemInfo())}) {
            for (const char* property : {"Id", "Name", "WindowInfos"}) {
                m_dock->set(path, QString::fromLatin1(property), value);
            }
            __Entry entry(service, path, m_agent->bus());
            QVERIFY(entry.isValid());
            QVERIFY(entry.windowInfos().isEmpty());
            QCOMPARE(entry.id() + entry.name(), QString());
        }
    }

    void entryThatIsNotThereIsInvalid()
    {
        __Entry entry(service, path + QStringLiteral("x"), m_agent->bus());
        QVERIFY(!entry.isValid());
        QCOMPARE(entry.id(), QString());
        QCOMPARE(entry.name(), QString());
        QVERIFY(!entry.isDocked());
        QVERIFY(entry.windowInfos().isEmpty());
    }

    void entryOfNoDockIsInvalid()
    {
        m_dock.reset();
        QVERIFY(!__Entry(service, path, m_agent->bus()).isValid());
    }

    void changeIsSignalled_data()
    {
        QTest::addColumn<QDBusMessage>("ofName");
        QTest::addColumn<QDBusMessage>("ofWindows");
        const QString newName = QStringLiteral("新");
        QTest::newRow("as a property")
            << propertiesChanged({{name, newName}}) << propertiesChanged({{windowInfos, windows(3)}});
        QTest::newRow("by the entry's signal")
            << signalOf(path, interface, "NameChanged", {newName})
            << signalOf(path, interface, "WindowInfosChanged", {windows(3)});
    }

    void changeIsSignalled()
    {
        QFETCH(QDBusMessage, ofName);
        QFETCH(QDBusMessage, ofWindows);
        announce(ofName);
        QCOMPARE(*m_names, (QList<QVariantList>{{QStringLiteral("新")}}));
        QCOMPARE(m_windows->size(), 0);

        announce(ofWindows);
        QCOMPARE(m_windows->size(), 1);
        QCOMPARE(m_windows->first().first().value<WindowInfoMap>().keys(), (QList<uint>{1, 2, 3}));
        QCOMPARE(m_names->size(), 1);
    }

    void changeAnnouncedTwiceIsSignalledOnce()
    {
        for (const uint count : {3U, 0U, 3U}) {
            const QString newName = QString::number(count);
            announce(propertiesChanged({{name, newName}, {windowInfos, windows(count)}}));
            announce(signalOf(path, interface, "NameChanged", {newName}));
            announce(signalOf(path, interface, "WindowInfosChanged", {windows(count)}));
        }
        QCOMPARE(m_names->size(), 3);
        QCOMPARE(m_windows->size(), 3);
    }

    void knownValueIsNotSignalledAgain()
    {
        m_entry->name();
        m_entry->windowInfos();
        announce(propertiesChanged({{name, QStringLiteral("编辑器")}, {windowInfos, windows(2)}}));
        QCOMPARE(m_names->size() + m_windows->size(), 0);
    }

    void changeOfAnotherKindIsDropped_data()
    {
        QTest::addColumn<QDBusMessage>("signal");
        const QVariantMap both{{name, QStringLiteral("n")}, {windowInfos, windows(9)}};
        QTest::newRow("of another interface")
            << propertiesChanged(both, {}, QStringLiteral("com.norix.Other"));
        QTest::newRow("of another property")
            << propertiesChanged({{QStringLiteral("Icon"), QStringLiteral("n")}});
        QTest::newRow("of another type")
            << propertiesChanged({{name, 7}, {windowInfos, QStringLiteral("n")}});
        QTest::newRow("of another object")
            << signalOf(QStringLiteral("/elsewhere"), interface, "NameChanged", {QStringLiteral("n")});
        QTest::newRow("by another signal") << signalOf(path, interface, "Name", {QStringLiteral("n")});
        QTest::newRow("without a value") << signalOf(path, interface, "NameChanged");
    }

    void changeOfAnotherKindIsDropped()
    {
        QFETCH(QDBusMessage, signal);
        announce(signal);
        QCOMPARE(m_names->size() + m_windows->size(), 0);
    }

    void propertyDeclaredInvalidIsRead()
    {
        m_dock->set(path, name, QStringLiteral("新"));
        m_dock->set(path, windowInfos, windows(5));
        announce(propertiesChanged({}, {name, windowInfos}));
        QTRY_COMPARE(*m_names, (QList<QVariantList>{{QStringLiteral("新")}}));
        QTRY_COMPARE(m_windows->size(), 1);
        QCOMPARE(m_windows->first().first().value<WindowInfoMap>().size(), 5);
    }

    void manyDeclarationsCostTwoReads()
    {
        m_dock->hang();
        for (int declaration = 0; declaration < 100; ++declaration) {
            announce(propertiesChanged({}, {windowInfos}));
        }
        m_dock->set(path, windowInfos, windows(7));
        m_dock->answerAgain();
        QTRY_COMPARE(m_windows->size(), 1);
        QTRY_COMPARE(m_dock->reads(path, windowInfos), 2);
        QCOMPARE(m_windows->first().first().value<WindowInfoMap>().size(), 7);
    }

    void failedReadLeavesTheValue()
    {
        m_dock->set(path, name, QVariant());
        announce(propertiesChanged({}, {name}));
        QTRY_COMPARE(m_dock->reads(path, name), 1);
        announce(propertiesChanged({{name, QStringLiteral("later")}}));
        QCOMPARE(*m_names, (QList<QVariantList>{{QStringLiteral("later")}}));
    }

private:
    void announce(const QDBusMessage& signal) { m_dock->service().emitSignal(signal, m_agent->bus()); }

    std::unique_ptr<PropertyService> m_dock;
    std::unique_ptr<BusClient> m_agent;
    std::unique_ptr<__Entry> m_entry;
    std::unique_ptr<QSignalSpy> m_names;
    std::unique_ptr<QSignalSpy> m_windows;
};

QTEST_GUILESS_MAIN(DesktopProxiesEntryTest)
#include "desktopproxies_entry_test.moc"
