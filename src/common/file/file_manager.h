#pragma once

#include <QIODevice>
#include <QObject>
#include <QString>

/// Reads a whole text file, or writes one and creates its directories.
class FileManager : public QObject
{
    Q_OBJECT

public:
    static FileManager* GetInstance();

    /// Writes in the locale's encoding; the mode replaces or appends. Returns true even if writing failed:
    /// callers ignore the result.
    bool writeFile(const QString& path, const QString& content, QIODevice::OpenMode mode);

    /// The text up to the first NUL byte, read as UTF-8 with "\n" line ends; empty, with a warning, if the
    /// file cannot be opened.
    QString readFile(const QString& path);

private:
    FileManager() = default;
};
