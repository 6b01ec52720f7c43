#include <QProcess>
#include <QtTest>

#include "terminal_address.h"

Q_DECLARE_METATYPE(InterfaceState)

namespace {

constexpr auto kUp = QNetworkInterface::IsUp;
constexpr auto kRunning = QNetworkInterface::IsUp | QNetworkInterface::IsRunning;

QList<QHostAddress> addressesOf(const QString& texts)
{
    QList<QHostAddress> addresses;
    const QStringList parts = texts.split(QLatin1Char(' '), Qt::SkipEmptyParts);
    for (const QString& part : parts) {
        addresses.append(QHostAddress(part));
    }
    return addresses;
}

int ip(const char* command)
{
    return QProcess::execute(QStringLiteral("ip"), QString::fromLatin1(command).split(QLatin1Char(' ')));
}

} // namespace

/// Runs in a network of its own, with nothing but a loopback interface that is down.
class TerminalAddressTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void addressIsTheLastIpv4AddressThatIsNotTheLoopbacks_data()
    {
        QTest::addColumn<QString>("addresses");
        QTest::addColumn<QString>("expected");

        const auto row = [](const char* addresses, const char* expected) {
            QTest::newRow(addresses) << QString::fromLatin1(addresses) << QString::fromLatin1(expected);
        };
        row("", "");
        row("127.0.0.1 ::1", "");
        row("127.0.0.1 fd00::7", "");
        row("127.0.0.1 10.0.0.5 192.168.1.7", "192.168.1.7");
        row("127.0.0.1 192.168.1.7 10.0.0.5", "10.0.0.5");
        row("10.0.0.5 127.0.0.1", "10.0.0.5");
        row("127.0.0.1 10.0.0.5 ::1 fd00::7", "10.0.0.5");
        row("127.0.0.1 169.254.7.7", "169.254.7.7");
        row("127.0.0.1 127.0.0.2", "127.0.0.2");
    }

    void addressIsTheLastIpv4AddressThatIsNotTheLoopbacks()
    {
        QFETCH(QString, addresses);
        QTEST(lastIpv4Address(addressesOf(addresses)), "expected");
    }

    void hardwareAddressIsTheGreatestOfTheRunningInterfaces_data()
    {
        QTest::addColumn<QList<InterfaceState>>("interfaces");
        QTest::addColumn<QString>("expected");

        const InterfaceState loopback{kRunning, QStringLiteral("00:00:00:00:00:00")};
        const InterfaceState lesser{kRunning, QStringLiteral("9E:FF:FF:FF:FF:FF")};
        const InterfaceState greater{kRunning, QStringLiteral("AA:00:00:00:00:01")};
        const InterfaceState withoutCarrier{kUp, QStringLiteral("FE:ED:00:00:00:02")};
        const InterfaceState down{{}, QStringLiteral("FE:ED:00:00:00:03")};

        using Interfaces = QList<InterfaceState>;
        QTest::newRow("none") << Interfaces{} << QString();
        QTest::newRow("the loopback's") << Interfaces{loopback} << loopback.hardwareAddress;
        QTest::newRow("greater last") << Interfaces{loopback, lesser, greater} << greater.hardwareAddress;
        QTest::newRow("greater first") << Interfaces{greater, lesser, loopback} << greater.hardwareAddress;
        QTest::newRow("without a carrier") << Interfaces{lesser, withoutCarrier} << lesser.hardwareAddress;
        QTest::newRow("down") << Interfaces{down, lesser} << lesser.hardwareAddress;
        QTest::newRow("none that runs") << Interfaces{down, withoutCarrier} << QString();
    }

    void hardwareAddressIsTheGreatestOfTheRunningInterfaces()
    {
        QFETCH(QList<InterfaceState>, interfaces);
        QTEST(greatestHardwareAddress(interfaces), "expected");
    }

    void addressesAreThoseOfTheMoment()
    {
        QCOMPARE(terminalAddress(), QString());
        QCOMPARE(terminalHardwareAddress(), QString());

        QCOMPARE(ip("address add 10.0.0.5/8 dev lo"), 0);
        QCOMPARE(ip("link set lo up"), 0);

        QCOMPARE(terminalAddress(), QStringLiteral("10.0.0.5"));
        QCOMPARE(terminalHardwareAddress(), QStringLiteral("00:00:00:00:00:00"));
    }
};

QTEST_GUILESS_MAIN(TerminalAddressTest)

#include "terminal_address_test.moc"
