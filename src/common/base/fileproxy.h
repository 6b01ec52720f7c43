#pragma once

#include <QByteArray>
#include <QFile>
#include <QObject>

namespace velk::base {

/// A file handle that logs why it could not be opened. Opening it again closes the previous file.
class FileProxy : public QObject
{
    Q_OBJECT

public:
    explicit FileProxy(QObject* parent = nullptr);

    /// False, with one warning, if the file cannot be opened.
    bool open(const QString& fileName, QIODevice::OpenMode mode);

    QByteArray readAll();

    /// The number of bytes written: fewer than given on a full disk, -1 if none could be written.
    qint64 write(const QByteArray& content);

private:
    QFile m_file;
};

} // namespace velk::base
