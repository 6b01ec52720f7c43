#include "environment_checks.h"

#include <QDBusConnection>
#include <QDBusError>
#include <QDir>
#include <QFileInfo>

#include <unistd.h>

#include "package_tool.h"
#include "remote_object.h"
#include "services.h"

namespace velk::check {

namespace {

struct Service
{
    QString name;
    Grade whenAbsent;
    const char* purpose; ///< what does not work without it
};

const QList<Service> kSystemServices{
    {service::kDaemon, Grade::Bad, "no policy arrives, nothing is reported"},
    {service::kLoginManager, Grade::Bad, "the user's name is not known, nobody can be logged out"},
    {service::kIdentityService, Grade::Warning, "leaving the domain does not switch it off"},
};

const QList<Service> kSessionServices{
    {service::kPolicyService, Grade::Warning, "forwarded policies are lost"},
    {service::kNotifications, Grade::Bad, "the user sees no warning and no message"},
    {service::kScreenSaver, Grade::Warning, "the session never counts as behind the screen saver"},
    {service::kSessionManager, Grade::Warning, "the session never counts as locked"},
    {service::kDock, Grade::Warning, "opened applications are not reported"},
    {service::kLauncher, Grade::Warning, "software is not reported"},
};

Finding checkService(const QDBusConnection& bus, const Service& service)
{
    if (isOnBus(bus, service.name)) {
        return {Grade::Good, QStringLiteral("service"), service.name + QStringLiteral(" is there")};
    }
    return {service.whenAbsent, QStringLiteral("service"),
            QStringLiteral("%1 is not there: %2").arg(service.name, QString::fromLatin1(service.purpose))};
}

Findings checkBus(const QDBusConnection& bus, const QString& kind, const QList<Service>& services)
{
    if (!bus.isConnected()) {
        return {{Grade::Bad, kind + QStringLiteral(" bus"),
                 QStringLiteral("cannot be reached: ") + bus.lastError().message()}};
    }
    Findings findings;
    for (const Service& service : services) {
        findings.append(checkService(bus, service));
    }
    return findings;
}

Finding checkPackageTool(const QString& program, const QStringList& arguments)
{
    const PackageToolRun run = runPackageTool(program, arguments);
    const QString subject = QStringLiteral("package tool");
    if (run.ended && !run.output.isEmpty()) {
        return {Grade::Good, subject, program + QStringLiteral(" works")};
    }
    return {Grade::Warning, subject,
            program + QStringLiteral(" does not work: reports of software are incomplete")};
}

Finding checkUnit()
{
    const QString subject = QStringLiteral("unit");
    const QString state = runPackageTool(QStringLiteral("systemctl"),
                                         {QStringLiteral("--user"), QStringLiteral("is-active"),
                                          QStringLiteral("velks.service")})
                              .output.trimmed();
    if (state == QLatin1String("active")) {
        return {Grade::Good, subject, QStringLiteral("velks.service is active")};
    }
    if (state == QLatin1String("failed")) {
        return {Grade::Bad, subject,
                QStringLiteral("velks.service has failed; see journalctl --user -u velks")};
    }
    if (state.isEmpty()) {
        return {Grade::Warning, subject, QStringLiteral("there is no user service manager to ask")};
    }
    return {Grade::Warning, subject,
            QStringLiteral("velks.service is %1; start it with systemctl --user start velks").arg(state)};
}

QByteArray processName(const QString& folder)
{
    QFile file(folder + QStringLiteral("/comm"));
    return file.open(QIODevice::ReadOnly) ? file.readAll().trimmed() : QByteArray();
}

QFileInfoList runningAgents()
{
    QFileInfoList agents;
    const QFileInfoList processes =
        QDir(QStringLiteral("/proc")).entryInfoList({QStringLiteral("[1-9]*")}, QDir::Dirs);
    for (const QFileInfo& process : processes) {
        if (process.ownerId() == getuid() && processName(process.filePath()) == "velks") {
            agents.append(process);
        }
    }
    return agents;
}

/// Whether another program has taken the place of the one that a process runs, as in an upgrade.
bool runsReplacedProgram(const QFileInfo& process)
{
    return QFile::symLinkTarget(process.filePath() + QStringLiteral("/exe"))
        .endsWith(QStringLiteral(" (deleted)"));
}

Finding checkProcess()
{
    const QString subject = QStringLiteral("agent");
    const QFileInfoList agents = runningAgents();
    if (agents.isEmpty()) {
        return {Grade::Bad, subject, QStringLiteral("does not run")};
    }
    if (agents.size() > 1) {
        return {Grade::Bad, subject, QStringLiteral("runs %1 times; there must be one").arg(agents.size())};
    }
    if (runsReplacedProgram(agents.first())) {
        return {Grade::Warning, subject,
                QStringLiteral("runs an older program than the one installed; "
                               "systemctl --user restart velks changes that")};
    }
    return {Grade::Good, subject, QStringLiteral("runs")};
}

} // namespace

Findings checkServices()
{
    return checkBus(QDBusConnection::systemBus(), QStringLiteral("system"), kSystemServices)
        + checkBus(QDBusConnection::sessionBus(), QStringLiteral("session"), kSessionServices);
}

Findings checkPackageTools()
{
    const QString versionOption = QStringLiteral("--version");
    return {checkPackageTool(QStringLiteral("dpkg"), {versionOption}),
            checkPackageTool(QStringLiteral("/usr/bin/dpkg-query"), {versionOption}),
            checkPackageTool(QStringLiteral("/usr/bin/dpkg-architecture"), {versionOption})};
}

Findings checkAgent()
{
    return {checkUnit(), checkProcess()};
}

} // namespace velk::check
