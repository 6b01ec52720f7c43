#pragma once

#include <QString>

namespace velk::check {

/// While it exists, keeps log lines of the agent's classes out of the report and remembers the last warning,
/// which gives the reason of a failure. One at a time.
class CapturedLog
{
public:
    CapturedLog();
    ~CapturedLog();
    Q_DISABLE_COPY_MOVE(CapturedLog)

    static QString lastWarning();
};

} // namespace velk::check
