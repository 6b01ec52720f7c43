#include "launcher_guard.h"

#include <QDBusConnection>
#include <QDebug>
#include <QFileInfo>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>

#include <algorithm>
#include <optional>
#include <utility>

#include "constants.h"
#include "file_manager.h"
#include "launcherd.h"
#include "log_text.h"
#include "memory.h"
#include "package_tool.h"
#include "service_arrival.h"
#include "services.h"

namespace {

const QString kFailed = QStringLiteral("failed");

// For software that is known only from the launcher.
constexpr int kUnknownId = -1;
constexpr int kInstalledByUser = 2;

__Launcherd* newLauncher(QObject* parent)
{
    return new __Launcherd(velk::service::kLauncher, QStringLiteral("/com/norix/kpx/daemon/Launcher"),
                           QDBusConnection::sessionBus(), parent);
}

/// Runs a command line without a shell: splits it at blanks outside double quotes; no other character is
/// special.
PackageToolRun runCommandLine(const QString& commandLine, const QProcessEnvironment& environment = {})
{
    QStringList parts = QProcess::splitCommand(commandLine);
    const QString program = parts.takeFirst();
    return runPackageTool(program, parts, environment);
}

/// The records of an inventory file, without their versions; none if it holds no array.
std::optional<QList<SoftwareInfo>> recordsOf(const QString& path)
{
    const QString text = FileManager::GetInstance()->readFile(path);
    qInfo().noquote() << " SoftwareGuard::getSoftwareList---------" << quoted(path) << ":" << quoted(text);

    QJsonParseError error{};
    const QJsonDocument document = QJsonDocument::fromJson(text.toLocal8Bit(), &error);
    if (error.error != QJsonParseError::NoError || !document.isArray()) {
        return {};
    }
    const QJsonArray array = document.array();
    qInfo() << " SoftwareGuard::getSoftwareList---------" << array.size();
    QList<SoftwareInfo> records;
    for (const QJsonValue& record : array) {
        SoftwareInfo info;
        info.packageName = record[QLatin1String("package_name")].toString();
        info.name = record[QLatin1String("name")].toString();
        info.architecture = record[QLatin1String("architecture")].toString();
        info.id = record[QLatin1String("id")].toInt();
        info.installedType = record[QLatin1String("installed_type")].toInt();
        records.append(info);
    }
    return records;
}

} // namespace

LauncherGuard::LauncherGuard(QObject* parent)
    : QObject(parent)
{
    auto* launcher = newLauncher(this);
    if (launcher->isValid()) {
        watchLauncher(launcher);
        return;
    }
    delete launcher;
    qWarning() << "launcher service is not registered, wait..";
    connect(new ServiceArrival(velk::service::kLauncher, this), &ServiceArrival::arrived, this, [this] {
        watchLauncher(newLauncher(this));
        Q_EMIT softwareInited();
    });
}

void LauncherGuard::watchLauncher(__Launcherd* launcher)
{
    m_launcher = launcher;
    connect(m_launcher, &__Launcherd::ItemChanged, this, &LauncherGuard::onItemChanged);
}

void LauncherGuard::onItemChanged(const QString& action, const LauncherItemInfo& info,
                                  qlonglong /*categoryId*/)
{
    qInfo() << "onItemChanged"
            << "----------" << action << info.path << info.name << info.firstDetail << info.secondDetail
            << info.firstNumber << info.secondNumber;
    const QString version = getCurVersion(getPackageNameByDesktop(info.path));
    Q_EMIT softwareChanged(action, {info.name, version});
}

LauncherItemInfoList LauncherGuard::GetLauncerItems()
{
    if (m_launcher == nullptr) {
        qInfo() << "launcher service is not init";
        return {};
    }
    QDBusPendingReply<LauncherItemInfoList> reply = m_launcher->GetAllItemInfos();
    reply.waitForFinished();
    qInfo() << "GetLauncerItems"
            << "--------" << reply.error();
    return reply.isError() ? LauncherItemInfoList() : reply.value();
}

QString LauncherGuard::getPackageNameByDesktop(const QString& desktop)
{
    const QFileInfo file(desktop);
    const QString path = file.isSymLink() ? file.symLinkTarget() : desktop;
    const QString output = runPackageTool(QStringLiteral("dpkg"), {QStringLiteral("-S"), path}).output;
    const QStringList parts = output.split(QLatin1Char(':'), Qt::SkipEmptyParts);
    if (parts.isEmpty()) {
        qWarning() << "get package name failed, desktop:" << path << output;
        return QString();
    }
    return parts.constFirst();
}

QString LauncherGuard::getCurVersion(const QString& packageName)
{
    if (packageName.isEmpty()) {
        qWarning() << "get version failed, empty packageName";
        return kFailed;
    }
    // Copied before LC_ALL is set: the first child runs without LC_ALL=C, all later ones with it.
    // Replacements of the tool rely on this order.
    const QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    qputenv("LC_ALL", "C");

    // The quotes reach the tool, which prints them around the version.
    const PackageToolRun run = runCommandLine(
        QStringLiteral("/usr/bin/dpkg-query  -W -f='${Version}' %1").arg(packageName), environment);
    if (!run.ended) {
        return kFailed;
    }
    QString version = run.output;
    version.remove(0, 1);
    version.chop(1);
    return version;
}

QString LauncherGuard::getCurArch()
{
    const PackageToolRun run =
        runCommandLine(QStringLiteral("/usr/bin/dpkg-architecture -q DEB_HOST_ARCH_CPU"));
    return run.ended ? run.output.trimmed() : kFailed;
}

bool LauncherGuard::getSoftwareList(const QString& path)
{
    const std::optional<QList<SoftwareInfo>> records = recordsOf(path);
    if (!records) {
        return false;
    }
    // Forking a child takes longer the more memory the agent holds. The file's text and its JSON document are
    // many times as large as the records, so they must be freed before the first child.
    giveMemoryBack();
    for (SoftwareInfo info : *records) {
        info.version = getCurVersion(info.packageName);
        qInfo() << " SoftwareGuard::getSoftwareList---------" << info.id;
        m_softwareList.append(info);
    }
    return true;
}

QList<SoftwareInfo> LauncherGuard::getSoftwareList()
{
    const LauncherItemInfoList items = GetLauncerItems();
    m_softwareList.clear();
    getSoftwareList(velk::kVELKSoftwareListPath);
    getSoftwareList(velk::kPRYGSoftwareListPath);
    qInfo() << "SoftwareGuard::getSoftwareList()--11111111111-" << m_softwareList.size();

    const QString architecture = getCurArch();
    QList<SoftwareInfo> result;
    for (const LauncherItemInfo& item : items) {
        result.append(softwareOf(item, architecture));
    }
    m_softwareList.clear();
    qInfo() << "SoftwareGuard::getSoftwareList()---" << result.size();
    return result;
}

SoftwareInfo LauncherGuard::softwareOf(const LauncherItemInfo& item, const QString& architecture)
{
    const QString packageName = getPackageNameByDesktop(item.path);
    const auto recorded =
        std::find_if(m_softwareList.cbegin(), m_softwareList.cend(),
                     [&](const SoftwareInfo& record) { return record.packageName == packageName; });
    if (recorded != m_softwareList.cend()) {
        SoftwareInfo info = *recorded;
        info.name = item.name;
        return info;
    }
    return {packageName, item.name, kUnknownId, getCurVersion(packageName), architecture, kInstalledByUser};
}
