#include "bus_client.h"
#include "entry.h"
#include "property_service.h"

#include <QDBusMetaType>
#include <QTest>

#include <array>
#include <memory>

namespace {

const QString service = QStringLiteral("com.norix.kpx.daemon.Dock");
const QString otherService = QStringLiteral("com.norix.Other.Dock");
const QString path = QStringLiteral("/entry");
const QString otherPath = QStringLiteral("/entry2");

QDBusMessage nameChanged(const QString& name)
{
    auto signal = QDBusMessage::createSignal(path, QString::fromLatin1(__Entry::staticInterfaceName()),
                                             QStringLiteral("NameChanged"));
    signal << name;
    return signal;
}

} // namespace

/// Several entries at a time, each of which is told only what is its own.
class DesktopProxiesEntriesTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase();

    void entriesOfOtherPathsAreNotTold();
    void entriesOfOnePathAreAllTold();
    void entryThatHasGoneLeavesTheOthersOfItsPath();
    void entryMayBeLetGoOfWhileItsPathIsToldOfAChange();
    void entriesOfTwoDocksAreKeptApart();
    void otherWindowsAreAChangeThoughTheyAreAsMany();

private:
    void tell(const PropertyService& dock, const QString& name)
    {
        dock.service().emitSignal(nameChanged(name), m_agent.bus());
    }

    BusClient m_agent;
};

void DesktopProxiesEntriesTest::initTestCase()
{
    qRegisterMetaType<WindowInfoMap>("QMap<uint,WindowInfo>");
    qDBusRegisterMetaType<QMap<uint, QString>>();
}

void DesktopProxiesEntriesTest::entriesOfOtherPathsAreNotTold()
{
    const PropertyService dock(service);
    __Entry entry(service, path, m_agent.bus());
    __Entry other(service, otherPath, m_agent.bus());
    QSignalSpy told(&entry, &__Entry::NameChanged);
    QSignalSpy othersTold(&other, &__Entry::NameChanged);

    tell(dock, QStringLiteral("Mail"));

    QCOMPARE(told.size(), 1);
    QCOMPARE(othersTold.size(), 0);
}

void DesktopProxiesEntriesTest::entriesOfOnePathAreAllTold()
{
    const PropertyService dock(service);
    __Entry older(service, path, m_agent.bus());
    __Entry newer(service, path, m_agent.bus());
    QSignalSpy olderTold(&older, &__Entry::NameChanged);
    QSignalSpy newerTold(&newer, &__Entry::NameChanged);

    tell(dock, QStringLiteral("Mail"));

    QCOMPARE(olderTold.size(), 1);
    QCOMPARE(newerTold.size(), 1);
}

void DesktopProxiesEntriesTest::entryThatHasGoneLeavesTheOthersOfItsPath()
{
    const PropertyService dock(service);
    auto older = std::make_unique<__Entry>(service, path, m_agent.bus());
    __Entry newer(service, path, m_agent.bus());
    QSignalSpy newerTold(&newer, &__Entry::NameChanged);

    older.reset();
    tell(dock, QStringLiteral("Mail"));

    QCOMPARE(newerTold.size(), 1);
}

void DesktopProxiesEntriesTest::entryMayBeLetGoOfWhileItsPathIsToldOfAChange()
{
    const PropertyService dock(service);
    std::array<std::unique_ptr<__Entry>, 2> entries;
    int told = 0;
    for (auto& entry : entries) {
        entry = std::make_unique<__Entry>(service, path, m_agent.bus());
    }
    for (std::size_t i = 0; i < entries.size(); ++i) {
        connect(entries.at(i).get(), &__Entry::NameChanged, [&entries, &told, i] {
            ++told;
            entries.at(1 - i).reset();
        });
    }

    tell(dock, QStringLiteral("Mail"));

    QCOMPARE(told, 1);
}

void DesktopProxiesEntriesTest::entriesOfTwoDocksAreKeptApart()
{
    const PropertyService dock(service);
    const PropertyService otherDock(otherService);
    __Entry entry(service, path, m_agent.bus());
    __Entry other(otherService, path, m_agent.bus());
    QSignalSpy told(&entry, &__Entry::NameChanged);
    QSignalSpy othersTold(&other, &__Entry::NameChanged);

    tell(otherDock, QStringLiteral("Mail"));

    QCOMPARE(told.size(), 0);
    QCOMPARE(othersTold, (QList<QVariantList>{{QStringLiteral("Mail")}}));
}

void DesktopProxiesEntriesTest::otherWindowsAreAChangeThoughTheyAreAsMany()
{
    const PropertyService dock(service);
    __Entry entry(service, path, m_agent.bus());
    QSignalSpy told(&entry, &__Entry::WindowInfosChanged);

    for (const uint window : {1U, 2U, 2U}) {
        auto signal = QDBusMessage::createSignal(path, QString::fromLatin1(__Entry::staticInterfaceName()),
                                                 QStringLiteral("WindowInfosChanged"));
        signal << QVariant::fromValue(QMap<uint, QString>{{window, {}}});
        dock.service().emitSignal(signal, m_agent.bus());
    }

    QCOMPARE(told.size(), 2);
}

QTEST_GUILESS_MAIN(DesktopProxiesEntriesTest)
#include "desktopproxies_entries_test.moc"
