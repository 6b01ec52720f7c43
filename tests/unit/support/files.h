#pragma once

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStringList>

#include <sys/resource.h>

#include <csignal>

inline const QFile::Permissions kReadWrite = QFile::ReadOwner | QFile::WriteOwner;
inline const QFile::Permissions kNoAccess{};

/// Puts a readable and writable file with this content at the path.
inline void writeBytes(const QString& path, const QByteArray& content)
{
    QFile file(path);
    QFile::setPermissions(path, kReadWrite);
    if (!file.open(QIODevice::WriteOnly) || file.write(content) != content.size()) {
        qFatal("cannot write %s", qPrintable(path));
    }
}

/// The content of a file, made readable for that; nothing if there is none.
inline QByteArray readBytes(const QString& path)
{
    QFile file(path);
    QFile::setPermissions(path, kReadWrite);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

inline void setPermissions(const QString& path, QFile::Permissions permissions)
{
    if (!QFile::setPermissions(path, permissions)) {
        qFatal("cannot change the permissions of %s", qPrintable(path));
    }
}

/// Removes what is at the path: nothing, a file or a folder.
inline void removeAny(const QString& path)
{
    if (QFileInfo(path).isDir()) {
        QDir(path).removeRecursively();
    } else {
        QFile::remove(path);
    }
}

/// How many handles this program holds on a file.
inline int openHandles(const QString& path)
{
    int count = 0;
    const auto handles = QDir(QStringLiteral("/proc/self/fd")).entryInfoList(QDir::Files | QDir::System);
    for (const QFileInfo& handle : handles) {
        count += handle.symLinkTarget() == path ? 1 : 0;
    }
    return count;
}

/// While it lives, no file grows beyond so many bytes, as on a full disk.
class FileSizeLimit
{
public:
    explicit FileSizeLimit(rlim_t bytes)
    {
        getrlimit(RLIMIT_FSIZE, &m_previous);
        const rlimit limit{bytes, m_previous.rlim_max};
        // With its signal ignored, a write beyond the limit fails instead of ending the program.
        if (std::signal(SIGXFSZ, SIG_IGN) == SIG_ERR || setrlimit(RLIMIT_FSIZE, &limit) != 0) {
            qFatal("cannot limit the size of files");
        }
    }
    ~FileSizeLimit() { setrlimit(RLIMIT_FSIZE, &m_previous); }
    Q_DISABLE_COPY_MOVE(FileSizeLimit)

private:
    rlimit m_previous{};
};
