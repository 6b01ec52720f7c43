#include <QDBusMetaType>
#include <QTest>

#include <array>
#include <memory>
#include <optional>

#include "bus_client.h"
#include "entry.h"
#include "property_service.h"

namespace {

const QString service = QStringLiteral("com.norix.kpx.daemon.Dock");
const QString interface = QString::fromLatin1(__Entry::staticInterfaceName());
const QString path = QStringLiteral("/entry");

} // namespace

/// Several entries at a time, each of which signals only its own changes.
class DesktopProxiesEntriesTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        qRegisterMetaType<WindowInfoMap>("QMap<uint,WindowInfo>");
        qDBusRegisterMetaType<QMap<uint, QString>>();
    }

    void changeIsSignalledByEveryEntryOfItsDockAndPathAlone_data()
    {
        QTest::addColumn<QString>("otherService");
        QTest::addColumn<QString>("otherPath");
        QTest::addColumn<int>("otherChanges");
        QTest::newRow("same dock and path") << service << path << 1;
        QTest::newRow("another path") << service << QStringLiteral("/entry2") << 0;
        QTest::newRow("another dock") << QStringLiteral("com.norix.Other.Dock") << path << 0;
    }

    void changeIsSignalledByEveryEntryOfItsDockAndPathAlone()
    {
        QFETCH(QString, otherService);
        QFETCH(QString, otherPath);
        const PropertyService dock(service);
        std::optional<PropertyService> otherDock;
        if (otherService != service) {
            otherDock.emplace(otherService);
        }
        __Entry entry(service, path, m_agent.bus());
        __Entry other(otherService, otherPath, m_agent.bus());
        QSignalSpy changes(&entry, &__Entry::NameChanged);
        QSignalSpy otherChanges(&other, &__Entry::NameChanged);

        announceName(dock, QStringLiteral("Mail"));

        QCOMPARE(changes, (QList<QVariantList>{{QStringLiteral("Mail")}}));
        QTEST(otherChanges.size(), "otherChanges");
    }

    void entryThatHasGoneLeavesTheOthersOfItsPath()
    {
        const PropertyService dock(service);
        auto older = std::make_unique<__Entry>(service, path, m_agent.bus());
        __Entry newer(service, path, m_agent.bus());
        QSignalSpy newerChanges(&newer, &__Entry::NameChanged);

        older.reset();
        announceName(dock, QStringLiteral("Mail"));

        QCOMPARE(newerChanges.size(), 1);
    }

    void entryMayBeDeletedWhileItsPathSignalsAChange()
    {
        const PropertyService dock(service);
        std::array<std::unique_ptr<__Entry>, 2> entries;
        int changes = 0;
        for (auto& entry : entries) {
            entry = std::make_unique<__Entry>(service, path, m_agent.bus());
        }
        for (std::size_t i = 0; i < entries.size(); ++i) {
            connect(entries.at(i).get(), &__Entry::NameChanged, [&entries, &changes, i] {
                ++changes;
                entries.at(1 - i).reset();
            });
        }

        announceName(dock, QStringLiteral("Mail"));

        QCOMPARE(changes, 1);
    }

    void otherWindowsAreAChangeThoughTheyAreAsMany()
    {
        const PropertyService dock(service);
        __Entry entry(service, path, m_agent.bus());
        QSignalSpy changes(&entry, &__Entry::WindowInfosChanged);

        for (const uint window : {1U, 2U, 2U}) {
            const QVariant windows = QVariant::fromValue(QMap<uint, QString>{{window, {}}});
            dock.service().emitSignal(signalOf(path, interface, "WindowInfosChanged", {windows}),
                                      m_agent.bus());
        }

        QCOMPARE(changes.size(), 2);
    }

private:
    void announceName(const PropertyService& dock, const QString& name)
    {
        dock.service().emitSignal(signalOf(path, interface, "NameChanged", {name}), m_agent.bus());
    }

    BusClient m_agent;
};

QTEST_GUILESS_MAIN(DesktopProxiesEntriesTest)
#include "desktopproxies_entries_test.moc"
