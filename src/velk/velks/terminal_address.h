#pragma once

#include <QString>

/// The last IPv4 address of the system's list that is not 127.0.0.1; empty without one.
QString terminalAddress();

/// The greatest hardware address, as text, of the interfaces that are up and running, the loopback interface
/// included; empty without one.
QString terminalHardwareAddress();
