#pragma once

#include <QHostAddress>
#include <QNetworkInterface>
#include <QString>

/// A network interface's state and hardware address.
struct InterfaceState
{
    QNetworkInterface::InterfaceFlags flags;
    QString hardwareAddress;
};

/// The last IPv4 address other than 127.0.0.1; empty if there is none.
QString lastIpv4Address(const QList<QHostAddress>& addresses);

/// The greatest hardware address, compared as text, of all interfaces that are up and running, including the
/// loopback interface; empty if there is none.
QString greatestHardwareAddress(const QList<InterfaceState>& interfaces);

/// The same for this terminal's current addresses and interfaces.
QString terminalAddress();
QString terminalHardwareAddress();
