/// Floor of forwarding: each signal of the daemon becomes one asynchronous call, whose reply is dropped.
/// usage: bench_forwarding [read]
/// With "read" it also does what must be done with a payload: it parses it, and writes it to the log as it
/// is.

#include <QCoreApplication>
#include <QDebug>
#include <QJsonDocument>
#include <QJsonObject>

#include "bare_proxies.h"

namespace {

int codeOf(const QString& payload)
{
    return QJsonDocument::fromJson(payload.toUtf8()).object().value(QLatin1String("type")).toInt();
}

} // namespace

int main(int argc, char* argv[])
{
    const QCoreApplication application(argc, argv);
    const bool reads = QCoreApplication::arguments().value(1) == QLatin1String("read");
    BareDaemon daemon;
    BarePolicyService policyService;
    QObject::connect(&daemon, &BareDaemon::pushPolicyMsg, &policyService,
                     [&policyService, reads](const QString& /*appID*/, const QString& payload) {
                         if (reads) {
                             qInfo().noquote() << payload;
                         }
                         if (!reads || codeOf(payload) != 0) {
                             policyService.asyncCall(QStringLiteral("onPolicyMsg"), payload);
                         }
                     });
    daemon.announce();
    return QCoreApplication::exec();
}
