#pragma once

#include <QProcessEnvironment>
#include <QString>
#include <QStringList>

/// The result of one run of a package tool.
struct PackageToolRun
{
    bool ended = false; ///< it started and ended in time
    QString output; ///< its standard output so far, read in the locale's encoding
};

/// Runs a program and waits for it, 30 s to start and 30 s to end. A program that does not end is killed
/// without further waiting. An empty environment stands for the agent's own.
PackageToolRun runPackageTool(const QString& program, const QStringList& arguments,
                              const QProcessEnvironment& environment = {});
