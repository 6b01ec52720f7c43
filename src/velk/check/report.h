#pragma once

#include <QByteArray>

#include "finding.h"

namespace velk::check {

/// The worst grade of all.
Grade overall(const Findings& findings);

/// One line per finding with its mark in front, and one that says what it all comes to.
QByteArray textReport(const Findings& findings);

/// The same for machines: {"result": MARK, "findings": [{"result": MARK, "subject": ..., "text": ...}]}.
QByteArray jsonReport(const Findings& findings);

} // namespace velk::check
