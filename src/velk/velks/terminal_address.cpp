#include "terminal_address.h"

#include <algorithm>

QString lastIpv4Address(const QList<QHostAddress>& addresses)
{
    QString result;
    for (const QHostAddress& address : addresses) {
        if (address.protocol() == QAbstractSocket::IPv4Protocol && address != QHostAddress::LocalHost) {
            result = address.toString();
        }
    }
    return result;
}

QString greatestHardwareAddress(const QList<InterfaceState>& interfaces)
{
    constexpr auto upAndRunning = QNetworkInterface::IsUp | QNetworkInterface::IsRunning;
    QString result;
    for (const InterfaceState& interface : interfaces) {
        if ((interface.flags & upAndRunning) == upAndRunning) {
            result = std::max(result, interface.hardwareAddress);
        }
    }
    return result;
}

QString terminalAddress()
{
    return lastIpv4Address(QNetworkInterface::allAddresses());
}

QString terminalHardwareAddress()
{
    QList<InterfaceState> interfaces;
    const QList<QNetworkInterface> known = QNetworkInterface::allInterfaces();
    for (const QNetworkInterface& interface : known) {
        interfaces.append({interface.flags(), interface.hardwareAddress()});
    }
    return greatestHardwareAddress(interfaces);
}
