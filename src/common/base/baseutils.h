#pragma once

#include <QString>

class QJsonObject;

namespace velk::base {

/// Shared by the operations on the daemon's information files. Each gives its name for the log (funcName).
class BaseUtils
{
public:
    static void openFailedLog(const QString& funcName);

    /// Copies the member to `out`, converted if it has another type (the default value of T if it cannot be).
    /// If there is no such member, returns false, logs one warning and does not change `out`. T is bool or
    /// QString.
    template <typename T>
    static bool getJsonObjectValue(const QJsonObject& obj, const QString& key, T& out,
                                   const QString& funcName);
};

} // namespace velk::base
