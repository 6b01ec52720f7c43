#pragma once

#include <QList>
#include <QString>

namespace velk::check {

enum class Grade {
    Good,
    Warning, ///< the agent works, but not all of it
    Bad, ///< the agent does not do its work
};

/// One line of the report.
struct Finding
{
    Grade grade;
    QString subject; ///< what was looked at, in a word or two
    QString text; ///< what was found, what follows from it, and what helps
};

using Findings = QList<Finding>;

} // namespace velk::check
