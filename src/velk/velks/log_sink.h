#pragma once

#include <QByteArray>

/// Sends the process's log lines to the journal where standard error is connected to it, as it is under a
/// service manager: priority, source file, line and function become fields of the entry. Anywhere else, and
/// where there is no journal, Qt goes on writing to standard error. The texts are the same. Lines that a
/// journal which hangs does not take are lost, and their number is told when it takes one again. To be called
/// once, before the first line.
void sendLogToJournal();

/// The name of a function without its result and arguments, from the compiler's full signature; that of the
/// enclosing function for a lambda. It is what people search the journal for.
QByteArray functionName(const char* signature);
