#include <QDBusMetaType>
#include <QDBusObjectPath>
#include <QSignalSpy>
#include <QTest>

#include "entryinfo.h"
#include "log_recorder.h"
#include "property_service.h"

using velk::module::software::EntryInfo;

namespace {

const QString path = QStringLiteral("/entry");
const QString mail = QStringLiteral("邮件");

QMap<uint, WindowInfo> windows(int count)
{
    QMap<uint, WindowInfo> infos;
    for (int window = 0; window < count; ++window) {
        infos.insert(static_cast<uint>(1000 + window), {});
    }
    return infos;
}

} // namespace

/// One entry of the dock, as the watcher of applications knows it.
class EntryInfoTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        qDBusRegisterMetaType<QMap<uint, QString>>();
        m_dock = std::make_unique<PropertyService>(QStringLiteral("com.norix.kpx.daemon.Dock"));
        m_dock->set(path, QStringLiteral("Id"), QStringLiteral("e0"));
        m_dock->set(path, QStringLiteral("Name"), mail);
        m_dock->set(path, QStringLiteral("IsDocked"), true);
        m_dock->set(path, QStringLiteral("WindowInfos"),
                    QVariant::fromValue(QMap<uint, QString>{{7, {}}, {8, {}}}));
    }

    void cleanup() { m_dock.reset(); }

    void entryIsKnownAsItWasFound()
    {
        const EntryInfo entry{QDBusObjectPath(path)};
        m_dock->set(path, QStringLiteral("Id"), QStringLiteral("another"));
        m_dock->set(path, QStringLiteral("Name"), QStringLiteral("another"));

        QCOMPARE(entry.entryId(), QStringLiteral("e0"));
        QCOMPARE(entry.appName(), mail);
        QCOMPARE(entry.winSize(), 2);
    }

    void whetherItIsDockedIsAskedEachTime()
    {
        const EntryInfo entry{QDBusObjectPath(path)};
        QVERIFY(entry.isDocked());
        m_dock->set(path, QStringLiteral("IsDocked"), false);
        QVERIFY(!entry.isDocked());
    }

    void unreachableEntryIsEmptyAndUsable()
    {
        m_dock.reset();
        const LogRecorder log;
        EntryInfo entry{QDBusObjectPath(path)};
        QSignalSpy changed(&entry, &EntryInfo::windowSizeChanged);

        QCOMPARE(log.lines(), QStringList{QStringLiteral("warning: entry is invalid, path: \"/entry\"")});
        QCOMPARE(entry.entryId() + entry.appName(), QString());
        QCOMPARE(entry.winSize(), 0);
        QVERIFY(!entry.isDocked());
        entry.onWinInfoChanged(windows(1));
        QCOMPARE(changed, (QList<QVariantList>{{1, QString()}}));
    }

    void changedNumberOfWindowsIsSignalledOnce_data()
    {
        QTest::addColumn<int>("count");
        QTest::addColumn<QList<QVariantList>>("signals");
        QTest::newRow("more") << 5 << QList<QVariantList>{{1, mail}};
        QTest::newRow("one less") << 1 << QList<QVariantList>{{2, mail}};
        QTest::newRow("none left") << 0 << QList<QVariantList>{{2, mail}};
        QTest::newRow("others, as many") << 2 << QList<QVariantList>();
    }

    void changedNumberOfWindowsIsSignalledOnce()
    {
        QFETCH(int, count);
        EntryInfo entry{QDBusObjectPath(path)};
        QSignalSpy changed(&entry, &EntryInfo::windowSizeChanged);

        entry.onWinInfoChanged(windows(count));
        entry.onWinInfoChanged(windows(count));

        QTEST(static_cast<QList<QVariantList>>(changed), "signals");
        QCOMPARE(entry.winSize(), count);
    }

private:
    std::unique_ptr<PropertyService> m_dock;
};

QTEST_GUILESS_MAIN(EntryInfoTest)
#include "entryinfo_test.moc"
