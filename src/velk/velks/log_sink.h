#pragma once

#include <QByteArray>

/// Sends the process's log lines to the journal where standard error is connected to it, as under a service
/// manager; priority, source file, line and function become fields of the entry. Elsewhere, and where there
/// is no journal, Qt keeps writing the same texts to standard error. Lines that a hung journal does not
/// accept are lost; when it accepts lines again, one line gives their number. Call this once, before the
/// first line.
void sendLogToJournal();

/// A function's name without its result and arguments, from the compiler's full signature; for a lambda, the
/// enclosing function's. People search the journal for it.
QByteArray functionName(const char* signature);
