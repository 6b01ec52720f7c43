#pragma once

#include <QByteArray>
#include <QFile>
#include <QObject>

namespace velk::base {

/// One file handle that logs why it could not be opened. It closes its file when it is opened anew and when
/// it is destroyed.
class FileProxy : public QObject
{
    Q_OBJECT

public:
    explicit FileProxy(QObject* parent = nullptr);

    /// False, with one warning, if the file cannot be opened.
    bool open(const QString& fileName, QIODevice::OpenMode mode);

    QByteArray readAll();

    /// How many bytes reached the file: fewer than given on a full disk, -1 if none could be written.
    qint64 write(const QByteArray& content);

private:
    QFile m_file;
};

} // namespace velk::base
