#include "bare_proxies.h"

#include <QDBusConnection>

#include <unistd.h>

BareDaemon::BareDaemon()
    : QDBusAbstractInterface(QStringLiteral("com.norix.velk.velkg"), QStringLiteral("/com/norix/velk/velkg"),
                             "com.norix.velk.velkg", QDBusConnection::systemBus(), nullptr)
{ }

void BareDaemon::announce()
{
    asyncCall(QStringLiteral("UpdateUserInfo"), qEnvironmentVariable("USER"), static_cast<int>(getuid()));
}

BarePolicyService::BarePolicyService()
    : QDBusAbstractInterface(QStringLiteral("com.norix.velk.prys"), QStringLiteral("/com/norix/velk/prys"),
                             "com.norix.velk.prys", QDBusConnection::sessionBus(), nullptr)
{ }

[[gnu::noinline]] void startEnds()
{
    asm volatile(""); // NOLINT(hicpp-no-assembler): keeps the call
}
