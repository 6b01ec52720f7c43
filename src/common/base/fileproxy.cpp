#include "fileproxy.h"

#include <QDebug>

namespace velk::base {

FileProxy::FileProxy(QObject* parent)
    : QObject(parent)
{ }

bool FileProxy::open(const QString& fileName, QIODevice::OpenMode mode)
{
    if (m_file.isOpen()) {
        m_file.close();
    }
    m_file.setFileName(fileName);
    // Unbuffered, so that a failed write is noticed at once and not lost when the file is closed.
    const bool opened = m_file.open(mode | QIODevice::Unbuffered);
    if (!opened) {
        qWarning() << "open file failed, file:" << fileName << ", mode:" << mode
                   << ", exist:" << m_file.exists();
    }
    return opened;
}

QByteArray FileProxy::readAll()
{
    return m_file.readAll();
}

qint64 FileProxy::write(const QByteArray& content)
{
    return m_file.write(content);
}

} // namespace velk::base
