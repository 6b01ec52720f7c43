#pragma once

#include <QStringList>

/// Runs a package tool and waits for its end; what it prints is read and dropped.
void runTool(const QString& program, const QStringList& arguments);

/// The one tool that each start and each inventory must run.
void askArchitecture();
