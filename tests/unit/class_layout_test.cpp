#include <QProcess>
#include <QtTest>

#include <algorithm>

#include "appopenspy.h"
#include "entryinfo.h"
#include "handleevent.h"
#include "launcher_guard.h"
#include "message_platform.h"
#include "message_transfer.h"

using velk::module::software::AppOpenSpy;
using velk::module::software::EntryInfo;

namespace {

constexpr size_t aligned(size_t size, size_t alignment)
{
    return (size + alignment - 1) / alignment * alignment;
}

/// The size of a class that holds these, its base among them, and nothing else.
template <typename... Parts> constexpr size_t sizeWith()
{
    size_t size = 0;
    // Pointers are meant. NOLINTNEXTLINE(bugprone-sizeof-expression)
    ((size = aligned(size, alignof(Parts)) + sizeof(Parts)), ...);
    return aligned(size, std::max({alignof(Parts)...}));
}

/// What this program's own debug information says of the types of a name, one text for each type and part.
/// Every preset builds with it.
QStringList debugInformation(const QString& typeName)
{
    QProcess reader;
    reader.setProcessChannelMode(QProcess::ForwardedErrorChannel);
    reader.start(QStringLiteral("llvm-dwarfdump"),
                 {QStringLiteral("--name=") + typeName, QStringLiteral("--show-children"),
                  QCoreApplication::applicationFilePath()});
    reader.waitForFinished();
    return QString::fromUtf8(reader.readAll()).split(QStringLiteral("\n\n"));
}

/// A text or number in what debugInformation() gave; empty if it is not there.
QString attribute(const QString& entry, const char* name)
{
    const QRegularExpression pattern(
        QStringLiteral(R"-(DW_AT_%1\s+\((?:0x\w+ )?"?(.*?)"?\)\n)-").arg(QString::fromLatin1(name)));
    return pattern.match(entry + QLatin1Char('\n'))
        .captured(1)
        .replace(QLatin1String("> >"), QLatin1String(">>"));
}

/// The bases and members of a class, each as "type name", or the values of an enumeration, as "name = value".
QStringList partsOf(const QString& typeName)
{
    // Parts of parts stand further to the right.
    static const QRegularExpression head(QStringLiteral("^0x[0-9a-f]+:( |   )DW_TAG_(\\w+)"));
    QStringList parts;
    bool isDefinition = false;
    const QStringList entries = debugInformation(typeName);
    for (const QString& entry : entries) {
        const auto found = head.match(entry);
        const QString kind = found.captured(2);
        if (found.captured(1) == QLatin1String(" ")) {
            if (isDefinition) {
                break; // the same type once more, from another source file
            }
            isDefinition = !attribute(entry, "byte_size").isEmpty();
        } else if (kind == QLatin1String("inheritance") || kind == QLatin1String("member")) {
            const QString part = attribute(entry, "type") + QLatin1Char(' ') + attribute(entry, "name");
            parts << part.trimmed();
        } else if (kind == QLatin1String("enumerator")) {
            const int value = attribute(entry, "const_value").toInt(nullptr, 0);
            parts << attribute(entry, "name") + QStringLiteral(" = ") + QString::number(value);
        }
    }
    return parts;
}

template <typename Class, typename... Parts> void row(const char* name, const char* parts)
{
    QTest::newRow(name) << QString::fromLatin1(parts).split(QStringLiteral("; ")) << quint64(sizeof(Class))
                        << quint64(sizeWith<Parts...>());
}

template <typename Class> void methodRow(const char* methods)
{
    const QMetaObject& meta = Class::staticMetaObject;
    QStringList found;
    for (int i = meta.methodOffset(); i < meta.methodCount(); ++i) {
        found << QString::fromLatin1(meta.method(i).methodSignature());
    }
    QTest::newRow(meta.className()) << found << QString::fromLatin1(methods).split(QStringLiteral("; "));
}

void messageRows()
{
    row<NotifyMessageOption, QString, bool, int, int, QString, QString>(
        "NotifyMessageOption",
        "QString uid; bool is_not_read; int limit; int offset; QString order; QString desc");
    row<NotifyMessage, QString, QString, QString, QString, QString, QString, QString>(
        "NotifyMessage",
        "QString uuid; QString uid; QString send_uid; QString title; QString content; "
        "QString created_at; QString read_at");
    row<NotifyMessageResponse, int, int, int, QVector<NotifyMessage>>(
        "NotifyMessageResponse", "int total; int offset; int limit; QVector<NotifyMessage> messages");
    row<MessagePlatform, QObject, QTimer*, QString, QString, QVector<NotifyMessage>, QString, QString,
        QString, QString, QString, MessageTransfer*>(
        "MessagePlatform",
        "QObject; QTimer * m_timer; QString m_userName; QString m_appPath; "
        "QVector<NotifyMessage> m_messages; QString m_host; QString m_port; QString m_requestUrl; "
        "QString m_listUrl; QString m_readUrl; MessageTransfer * m_transfer");
    row<HandleEvent, QObject, HttpClientApi*>("HandleEvent", "QObject; HttpClientApi * m_http");
}

void desktopRows()
{
    row<AppOpenSpy, QObject, __Dock*, QMap<QString, QSharedPointer<EntryInfo>>>(
        "AppOpenSpy",
        "QObject; __Dock * m_dock; "
        "QMap<QString, QSharedPointer<velk::module::software::EntryInfo>> m_entries");
    row<EntryInfo, QObject, __Entry, QString, QString, qint32>(
        "EntryInfo", "QObject; __Entry m_entry; QString m_entryId; QString m_appName; qint32 m_winSize");
    row<SoftwareInfo, QString, QString, qint32, QString, QString, qint32>(
        "SoftwareInfo",
        "QString packageName; QString name; qint32 id; QString version; QString architecture; "
        "qint32 installedType");
    row<LauncherGuard, QObject, QList<SoftwareInfo>, __Launcherd*>(
        "LauncherGuard", "QObject; QList<SoftwareInfo> m_softwareList; __Launcherd * m_launcher");
}

} // namespace

/// Other code is compiled against these classes: base, members, signals and slots are those listed here, of
/// these types and names, in this order, and no others. What is private counts too.
class ClassLayoutTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void classHoldsExactlyTheseParts_data()
    {
        QTest::addColumn<QStringList>("parts");
        QTest::addColumn<quint64>("size");
        QTest::addColumn<quint64>("sizeOfParts");
        messageRows();
        desktopRows();
        row<MessageTransfer, QObject, velkgInterface*, prysInterface*, LauncherGuard*, QTimer*, QTimer*,
            QString, QString, qint32, qint32>(
            "MessageTransfer",
            "QObject; velkgInterface * m_velkgInterface; prysInterface * m_prysInterface; "
            "LauncherGuard * m_launcherGuard; QTimer * m_actionTimer; QTimer * m_stateTimer; "
            "QString m_machineId; QString m_userName; qint32 m_uid; qint32 m_pendingAction");
    }

    void classHoldsExactlyTheseParts()
    {
        QFETCH(quint64, size);
        QTEST(partsOf(QString::fromLatin1(QTest::currentDataTag())), "parts");
        QTEST(size, "sizeOfParts");
    }

    void signalsAndSlotsStandInTheirOrder_data()
    {
        QTest::addColumn<QStringList>("found");
        QTest::addColumn<QStringList>("methods");
        methodRow<MessageTransfer>("onPolicyMsg(QString,QString); onSoftwareChanged(QString,QStringList); "
                                   "onTimeout(); getUserState()");
        methodRow<AppOpenSpy>("appStateChange(int,QString); onEntryAdded(QDBusObjectPath); "
                              "onEntryRemoved(QString)");
        methodRow<EntryInfo>("windowSizeChanged(int,QString); onWinInfoChanged(QMap<uint,WindowInfo>); "
                             "onNameChanged(QString)");
        methodRow<LauncherGuard>("softwareChanged(QString,QStringList); softwareInited(); "
                                 "onItemChanged(QString,LauncherItemInfo,qlonglong)");
    }

    void signalsAndSlotsStandInTheirOrder()
    {
        QFETCH(QStringList, found);
        QTEST(found, "methods");
    }

    void screenStatesAreExactlyThese()
    {
        const QStringList expected{QStringLiteral("ScreenSaverRunning = 0"),
                                   QStringLiteral("ScreenLocked = 1"), QStringLiteral("ScreenActive = 2")};
        QCOMPARE(partsOf(QStringLiteral("Screen_State")), expected);
        static_assert(std::is_same_v<decltype(&MessageTransfer::getScreenState),
                                     MessageTransfer::Screen_State (MessageTransfer::*)()>);
    }
};

QTEST_GUILESS_MAIN(ClassLayoutTest)
#include "class_layout_test.moc"
