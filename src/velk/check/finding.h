#pragma once

#include <QList>
#include <QString>

namespace velk::check {

enum class Grade {
    Good,
    Warning, ///< part of the agent's work fails
    Bad, ///< the agent cannot do its work
};

/// One line of the report.
struct Finding
{
    Grade grade;
    QString subject; ///< what was checked, in a word or two
    QString text; ///< the finding, its consequence and its remedy
};

using Findings = QList<Finding>;

} // namespace velk::check
