#include "environment_checks.h"

#include <QDir>
#include <QFileInfo>
#include <QHash>

#include <unistd.h>

#include "package_tool.h"

namespace velk::check {

namespace {

Finding checkPackageTool(const QString& program, const QString& package)
{
    const PackageToolRun run = runPackageTool(program, {QStringLiteral("--version")});
    const QString subject = QStringLiteral("package tool");
    if (run.ended && !run.output.isEmpty()) {
        return {Grade::Good, subject, program + QStringLiteral(" works")};
    }
    return {Grade::Warning, subject,
            program
                + QStringLiteral(" does not work: reports of software are incomplete; it comes with %1")
                      .arg(package)};
}

/// Properties of the unit by name, as the user's service manager tells them; none without one.
QHash<QString, QString> unitProperties()
{
    const QString output =
        runPackageTool(
            QStringLiteral("systemctl"),
            {QStringLiteral("--user"), QStringLiteral("show"), QStringLiteral("velks.service"),
             QStringLiteral(
                 "--property=LoadState,ActiveState,Result,ConditionResult,ConditionTimestampMonotonic")})
            .output;
    QHash<QString, QString> found;
    for (const QString& line : output.split(QLatin1Char('\n'))) {
        found.insert(line.section(QLatin1Char('='), 0, 0), line.section(QLatin1Char('='), 1));
    }
    return found;
}

/// What an administrator needs to know of a unit that is not active.
QString unitTrouble(const QHash<QString, QString>& unit)
{
    const QString state = unit.value(QStringLiteral("ActiveState"));
    if (unit.value(QStringLiteral("LoadState")) == QLatin1String("masked")) {
        return QStringLiteral(
            "masked: somebody wants no agent here; systemctl unmask changes that, with --global or "
            "--user as it was masked");
    }
    if (unit.value(QStringLiteral("LoadState")) == QLatin1String("not-found")) {
        return QStringLiteral("not known to the service manager; is the package installed whole?");
    }
    if (state == QLatin1String("activating")) {
        return QStringLiteral("about to start again after a failure; see journalctl --user -u velks");
    }
    if (state == QLatin1String("failed")) {
        return QStringLiteral("failed; see journalctl --user -u velks, then systemctl --user restart velks");
    }
    const bool wasLookedAt = unit.value(QStringLiteral("ConditionTimestampMonotonic")) != QLatin1String("0");
    if (unit.value(QStringLiteral("Result")) == QLatin1String("exec-condition")
        || (wasLookedAt && unit.value(QStringLiteral("ConditionResult")) == QLatin1String("no"))) {
        return QStringLiteral(
            "not meant to run for this user: neither greeters nor system accounts have an agent");
    }
    return QStringLiteral("%1; start it with systemctl --user start velks").arg(state);
}

Finding checkUnit()
{
    const QString subject = QStringLiteral("unit");
    const QHash<QString, QString> unit = unitProperties();
    const QString state = unit.value(QStringLiteral("ActiveState"));
    if (state.isEmpty()) {
        return {Grade::Warning, subject, QStringLiteral("there is no user service manager to ask")};
    }
    if (state == QLatin1String("active")) {
        return {Grade::Good, subject, QStringLiteral("velks.service is active")};
    }
    return {state == QLatin1String("failed") ? Grade::Bad : Grade::Warning, subject,
            QStringLiteral("velks.service is ") + unitTrouble(unit)};
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

/// Whether somebody has stopped a process without ending it.
bool isFrozen(const QFileInfo& process)
{
    QFile file(process.filePath() + QStringLiteral("/stat"));
    // The state follows the name, which is in brackets and may hold anything.
    return file.open(QIODevice::ReadOnly) && file.readAll().contains(") T ");
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
    if (isFrozen(agents.first())) {
        return {Grade::Bad, subject,
                QStringLiteral("is stopped by a signal and does nothing; kill -CONT lets it go on")};
    }
    if (runsReplacedProgram(agents.first())) {
        return {Grade::Warning, subject,
                QStringLiteral("runs an older program than the one installed; "
                               "systemctl --user restart velks changes that")};
    }
    return {Grade::Good, subject, QStringLiteral("runs")};
}

} // namespace

Findings checkPackageTools()
{
    const QString dpkg = QStringLiteral("dpkg");
    return {checkPackageTool(dpkg, dpkg), checkPackageTool(QStringLiteral("/usr/bin/dpkg-query"), dpkg),
            checkPackageTool(QStringLiteral("/usr/bin/dpkg-architecture"), QStringLiteral("dpkg-dev"))};
}

Findings checkAgent()
{
    return {checkUnit(), checkProcess()};
}

} // namespace velk::check
