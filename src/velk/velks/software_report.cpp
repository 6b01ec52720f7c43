#include "software_report.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include "launcher_guard.h"

namespace {

// The platform's types of the two reports.
constexpr int kSoftwareChangeType = 2002;
constexpr int kInventoryType = 1103;

QString report(int type, const QJsonObject& payload)
{
    const QJsonObject message{{QStringLiteral("type"), type}, {QStringLiteral("payload"), payload}};
    return QString::fromUtf8(QJsonDocument(message).toJson(QJsonDocument::Compact));
}

QJsonObject recordOf(const SoftwareInfo& software)
{
    return {{QStringLiteral("software_id"), software.id},
            {QStringLiteral("arch"), software.architecture},
            {QStringLiteral("name"), software.name},
            {QStringLiteral("version"), software.version},
            {QStringLiteral("package_name"), software.packageName},
            {QStringLiteral("installed_type"), software.installedType}};
}

} // namespace

int softwareChange(const QString& action)
{
    if (action == QLatin1String("created")) {
        return 1;
    }
    return action == QLatin1String("update") ? 2 : 0;
}

QString softwareChangeReport(const SoftwareChange& change)
{
    const QJsonObject payload{
        {QStringLiteral("type"), change.change},
        {QStringLiteral("machine_id"), change.machineId},
        {QStringLiteral("pc_ip"), change.ipAddress},
        {QStringLiteral("mac"), change.hardwareAddress},
        {QStringLiteral("software_name"), change.name},
        {QStringLiteral("software_version"), change.version},
        {QStringLiteral("pc_name"), change.terminalName},
        {QStringLiteral("operated_at"), change.time.toString(QStringLiteral("yyyy-MM-dd hh:mm:ss"))}};
    return report(kSoftwareChangeType, payload);
}

QString inventoryReport(const QString& machineId, const QList<SoftwareInfo>& list)
{
    QJsonArray records;
    for (const SoftwareInfo& software : list) {
        records.append(recordOf(software));
    }
    return report(kInventoryType,
                  {{QStringLiteral("machine_id"), machineId}, {QStringLiteral("list"), records}});
}
