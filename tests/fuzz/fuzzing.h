#pragma once

#include <QByteArray>

/// What a fuzz target defines: brings one input in on the path that it takes from outside. It must return
/// in short time and leave nothing behind, whatever the input; a crash, a leak, a sanitizer's report or a
/// requirement that is not met is a finding.
void tryInput(const QByteArray& input);

/// Ends the program, as a finding, unless the condition holds.
void require(bool condition, const char* what);
