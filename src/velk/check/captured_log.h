#pragma once

#include <QString>

namespace velk::check {

/// Keeps what the agent's classes log away from the report while it exists, and remembers the last warning,
/// which says why something did not work. One at a time.
class CapturedLog
{
public:
    CapturedLog();
    ~CapturedLog();
    Q_DISABLE_COPY_MOVE(CapturedLog)

    static QString lastWarning();
};

} // namespace velk::check
