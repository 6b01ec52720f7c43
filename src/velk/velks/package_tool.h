#pragma once

#include <QProcessEnvironment>
#include <QString>
#include <QStringList>

/// What became of one run of a package tool.
struct PackageToolRun
{
    bool ended = false; ///< it started and ended in time
    QString output; ///< its standard output up to there, read in the encoding of the locale
};

/// Runs a program and waits for it, 30 s to start and 30 s to end. A program that does not end is killed and
/// costs no further waiting. An empty environment is the agent's own.
PackageToolRun runPackageTool(const QString& program, const QStringList& arguments,
                              const QProcessEnvironment& environment = {});
