#pragma once

#include <QString>

/// A text as QDebug quotes it, to the character, for a log line that is told not to quote. QDebug looks every
/// character up in the Unicode tables and writes the short runs between two quotation marks of a JSON text
/// one by one; for a long policy that costs more than handing the policy on.
QString quoted(const QString& text);
