#pragma once

#include <QDateTime>
#include <QList>
#include <QString>

struct SoftwareInfo;

/// The report of one software change.
struct SoftwareChange
{
    int change = 0; ///< from softwareChange()
    QString machineId;
    QString ipAddress;
    QString hardwareAddress;
    QString name; ///< display name
    QString version;
    QString terminalName;
    QDateTime time; ///< local
};

/// The platform's code for an action of the launcher: 1 for "created", 2 for "update", 0 for any other.
int softwareChange(const QString& action);

/// The reports as compact JSON with sorted keys.
QString softwareChangeReport(const SoftwareChange& change);
QString inventoryReport(const QString& machineId, const QList<SoftwareInfo>& list);
