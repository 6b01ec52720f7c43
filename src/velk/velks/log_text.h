#pragma once

#include <QString>

/// A text, character for character as QDebug quotes it, for a log line with noquote(). QDebug is slower: it
/// looks each character up in the Unicode tables, and writes the short runs between a JSON text's quotation
/// marks one by one. For a long policy that costs more than forwarding the policy.
QString quoted(const QString& text);
