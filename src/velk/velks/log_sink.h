#pragma once

#include <QByteArray>

/// Sends the process's log lines to the journal where standard error is connected to it, as it is under a
/// service manager: priority, source file, line and function become fields of the entry. Anywhere else, and
/// where the journal does not take a line, Qt goes on writing to standard error. The texts are the same.
/// To be called once, before the first line.
void sendLogToJournal();

/// The name of a function without its result and arguments, from the compiler's full signature; that of the
/// enclosing function for a lambda. It is what people search the journal for.
QByteArray functionName(const char* signature);
