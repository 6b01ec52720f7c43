#pragma once

#include <QDBusArgument>
#include <QList>
#include <QMap>
#include <QMetaType>
#include <QString>

/// One item of the desktop's launcher, in the order of its fields on the wire: (ssssxx). What the last four
/// hold is the launcher's own business.
struct LauncherItemInfo
{
    QString path; ///< desktop file
    QString name; ///< display name
    QString firstDetail;
    QString secondDetail;
    qint64 firstNumber = 0;
    qint64 secondNumber = 0;
};

using LauncherItemInfoList = QList<LauncherItemInfo>;

/// One window of a dock entry. What a dock tells of it differs between docks and is not kept.
struct WindowInfo
{
};

/// The windows of an entry by their identifiers.
using WindowInfoMap = QMap<uint, WindowInfo>;

Q_DECLARE_METATYPE(LauncherItemInfo)
Q_DECLARE_METATYPE(LauncherItemInfoList)
Q_DECLARE_METATYPE(WindowInfo)

QDBusArgument& operator<<(QDBusArgument& argument, const LauncherItemInfo& info);
const QDBusArgument& operator>>(const QDBusArgument& argument, LauncherItemInfo& info);

/// Make the types known to the meta-type system, under their names, and to D-Bus marshalling. Both are needed
/// before the first launcher item is sent or received; calling them again changes nothing.
void registerLauncherItemInfoMetaType();
void registerLauncherItemInfoListMetaType();
