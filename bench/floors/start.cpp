/// Floor of a start: two proxies, the one child that a start must run, and one call; then idle.

#include <QCoreApplication>

#include "bare_proxies.h"
#include "package_tools.h"

int main(int argc, char* argv[])
{
    const QCoreApplication application(argc, argv);
    BareDaemon daemon;
    const BarePolicyService policyService;
    askArchitecture();
    daemon.announce();
    startEnds();
    return QCoreApplication::exec();
}
