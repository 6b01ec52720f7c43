#pragma once

#include <QIODevice>
#include <QObject>
#include <QString>

/// Whole text files: reads one, or writes one together with its directories.
class FileManager : public QObject
{
    Q_OBJECT

public:
    static FileManager* GetInstance();

    /// Writes in the encoding of the locale; the mode says whether it replaces or appends. Always true, even
    /// if nothing could be written: intended, callers go on either way and must not rely on it.
    bool writeFile(const QString& path, const QString& content, QIODevice::OpenMode mode);

    /// The text up to the first NUL byte, read as UTF-8 with lines ending in "\n"; empty, with a warning, if
    /// the file cannot be opened.
    QString readFile(const QString& path);

private:
    FileManager() = default;
};
