#include "baseutils.h"

#include <QDebug>
#include <QJsonObject>
#include <QVariant>

namespace velk::base {

void BaseUtils::openFailedLog(const QString& funcName)
{
    qWarning() << funcName << "open file failed!";
}

template <typename T>
bool BaseUtils::getJsonObjectValue(const QJsonObject& obj, const QString& key, T& out,
                                   const QString& funcName)
{
    if (!obj.contains(key)) {
        qWarning() << funcName << "can not get json key:" << key;
        return false;
    }
    out = obj.value(key).toVariant().template value<T>();
    return true;
}

template bool BaseUtils::getJsonObjectValue<bool>(const QJsonObject&, const QString&, bool&, const QString&);
template bool BaseUtils::getJsonObjectValue<QString>(const QJsonObject&, const QString&, QString&,
                                                     const QString&);

} // namespace velk::base
