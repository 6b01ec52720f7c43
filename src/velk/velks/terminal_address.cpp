#include "terminal_address.h"

#include <QHostAddress>
#include <QNetworkInterface>

#include <algorithm>

QString terminalAddress()
{
    QString result;
    const QList<QHostAddress> addresses = QNetworkInterface::allAddresses();
    for (const QHostAddress& address : addresses) {
        if (address.protocol() == QAbstractSocket::IPv4Protocol && address != QHostAddress::LocalHost) {
            result = address.toString();
        }
    }
    return result;
}

QString terminalHardwareAddress()
{
    constexpr auto upAndRunning = QNetworkInterface::IsUp | QNetworkInterface::IsRunning;
    QString result;
    const QList<QNetworkInterface> interfaces = QNetworkInterface::allInterfaces();
    for (const QNetworkInterface& interface : interfaces) {
        if ((interface.flags() & upAndRunning) == upAndRunning) {
            result = std::max(result, interface.hardwareAddress());
        }
    }
    return result;
}
