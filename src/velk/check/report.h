#pragma once

#include <QByteArray>

#include "finding.h"

namespace velk::check {

/// The worst grade of the findings; good without findings.
Grade overall(const Findings& findings);

/// One line per finding, its mark first, and a concluding line.
QByteArray textReport(const Findings& findings);

/// As JSON: {"result": MARK, "findings": [{"result": MARK, "subject": ..., "text": ...}]}.
QByteArray jsonReport(const Findings& findings);

} // namespace velk::check
