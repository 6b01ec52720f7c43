#pragma once

#include <QDBusArgument>
#include <QList>
#include <QMap>
#include <QMetaType>
#include <QString>

/// One item of the desktop's launcher, its fields in the order on the wire: (ssssxx). Only the launcher knows
/// the meaning of the last four.
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

/// One window of a dock entry. Its data varies between docks and is discarded.
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

/// Register the types with the meta-type system, under their names, and with D-Bus marshalling. Both are
/// needed before the first launcher item is sent or received; further calls change nothing.
void registerLauncherItemInfoMetaType();
void registerLauncherItemInfoListMetaType();
