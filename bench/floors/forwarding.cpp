/// Floor of forwarding: each signal of the daemon becomes one asynchronous call, whose reply is dropped.

#include <QCoreApplication>

#include "bare_proxies.h"

int main(int argc, char* argv[])
{
    const QCoreApplication application(argc, argv);
    BareDaemon daemon;
    BarePolicyService policyService;
    QObject::connect(&daemon, &BareDaemon::pushPolicyMsg, &policyService,
                     [&policyService](const QString& /*appID*/, const QString& payload) {
                         policyService.asyncCall(QStringLiteral("onPolicyMsg"), payload);
                     });
    daemon.announce();
    return QCoreApplication::exec();
}
