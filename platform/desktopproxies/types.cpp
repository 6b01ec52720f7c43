#include "types.h"

#include <QDBusMetaType>

QDBusArgument& operator<<(QDBusArgument& argument, const LauncherItemInfo& info)
{
    argument.beginStructure();
    argument << info.path << info.name << info.firstDetail << info.secondDetail << info.firstNumber
             << info.secondNumber;
    argument.endStructure();
    return argument;
}

const QDBusArgument& operator>>(const QDBusArgument& argument, LauncherItemInfo& info)
{
    argument.beginStructure();
    argument >> info.path >> info.name >> info.firstDetail >> info.secondDetail >> info.firstNumber
        >> info.secondNumber;
    argument.endStructure();
    return argument;
}

void registerLauncherItemInfoMetaType()
{
    qRegisterMetaType<LauncherItemInfo>("LauncherItemInfo");
    qDBusRegisterMetaType<LauncherItemInfo>();
}

void registerLauncherItemInfoListMetaType()
{
    qRegisterMetaType<LauncherItemInfoList>("LauncherItemInfoList");
    qDBusRegisterMetaType<LauncherItemInfoList>();
}
