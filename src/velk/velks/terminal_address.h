#pragma once

#include <QHostAddress>
#include <QNetworkInterface>
#include <QString>

/// What a network interface is known by.
struct InterfaceState
{
    QNetworkInterface::InterfaceFlags flags;
    QString hardwareAddress;
};

/// The last IPv4 address that is not 127.0.0.1; empty without one.
QString lastIpv4Address(const QList<QHostAddress>& addresses);

/// The greatest hardware address, as text, of the interfaces that are up and running, the loopback interface
/// included; empty without one.
QString greatestHardwareAddress(const QList<InterfaceState>& interfaces);

/// The same of this terminal's addresses and interfaces, as the system lists them now.
QString terminalAddress();
QString terminalHardwareAddress();
