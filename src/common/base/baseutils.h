#pragma once

#include <QString>

class QJsonObject;

namespace velk::base {

/// What the operations on the daemon's information files share. Each names itself (funcName) in the log.
class BaseUtils
{
public:
    static void openFailedLog(const QString& funcName);

    /// Copies the member to out, converted if it is of another type (the default value of T where that
    /// cannot be). False, with one warning and out untouched, if there is no such member. T is bool or
    /// QString.
    template <typename T>
    static bool getJsonObjectValue(const QJsonObject& obj, const QString& key, T& out,
                                   const QString& funcName);
};

} // namespace velk::base
