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
                + QStringLiteral(" does not work: software reports are incomplete; it comes with %1")
                      .arg(package)};
}

/// The unit's properties by name, from the user's service manager; empty without one.
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

/// The cause and the remedy of a unit that is not active.
QString unitTrouble(const QHash<QString, QString>& unit)
{
    const QString state = unit.value(QStringLiteral("ActiveState"));
    if (unit.value(QStringLiteral("LoadState")) == QLatin1String("masked")) {
        return QStringLiteral(
            "masked: an administrator or the user has disabled the agent; systemctl unmask undoes that, "
            "with --global or --user as it was masked");
    }
    if (unit.value(QStringLiteral("LoadState")) == QLatin1String("not-found")) {
        return QStringLiteral("unknown to the service manager; is the package fully installed?");
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

/// The kernel's status fields of a process: state, parent and others; empty if it has ended.
QList<QByteArray> statusOf(const QFileInfo& process)
{
    QFile file(process.filePath() + QStringLiteral("/stat"));
    if (!file.open(QIODevice::ReadOnly)) {
        return {};
    }
    const QByteArray content = file.readAll();
    // They follow the name, which is in parentheses and may hold any characters.
    return content.mid(content.lastIndexOf(") ") + 2).split(' ');
}

QFileInfoList processesOfThatName()
{
    QFileInfoList found;
    const QFileInfoList processes =
        QDir(QStringLiteral("/proc")).entryInfoList({QStringLiteral("[1-9]*")}, QDir::Dirs);
    for (const QFileInfo& process : processes) {
        if (process.ownerId() == getuid() && processName(process.filePath()) == "velks") {
            found.append(process);
        }
    }
    return found;
}

/// A forked child of the agent has the agent's name until it calls exec, but is not an agent.
QFileInfoList runningAgents()
{
    const QFileInfoList named = processesOfThatName();
    QList<QByteArray> pids;
    for (const QFileInfo& process : named) {
        pids.append(process.fileName().toLatin1());
    }
    QFileInfoList agents;
    for (const QFileInfo& process : named) {
        const QList<QByteArray> status = statusOf(process);
        if (!status.isEmpty() && !pids.contains(status.value(1))) {
            agents.append(process);
        }
    }
    return agents;
}

/// Whether a signal has stopped the process without ending it.
bool isFrozen(const QFileInfo& process)
{
    return statusOf(process).value(0) == "T";
}

/// Whether the process's program file has been replaced, as by an upgrade.
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
