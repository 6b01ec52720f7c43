/// Floor of a start: two proxies and one call, then idle.

#include <QCoreApplication>

#include "bare_proxies.h"

int main(int argc, char* argv[])
{
    const QCoreApplication application(argc, argv);
    BareDaemon daemon;
    const BarePolicyService policyService;
    daemon.announce();
    startEnds();
    return QCoreApplication::exec();
}
