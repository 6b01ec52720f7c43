#include "file_manager.h"

#include <QDebug>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QTextStream>

FileManager* FileManager::GetInstance()
{
    static FileManager instance;
    return &instance;
}

bool FileManager::writeFile(const QString& path, const QString& content, QIODevice::OpenMode mode)
{
    qInfo() << "FileManager::writeFile--###############-----" << path << ":" << content;
    const QDir folder = QFileInfo(path).absoluteDir();
    qInfo() << "FileManager::writeFile--###############-----" << folder.path();
    if (!folder.exists() && !folder.mkpath(folder.path())) {
        qInfo() << "mkpath error:" << folder.path();
    }

    QFile file(path);
    if (file.open(mode)) {
        QTextStream(&file) << content;
        file.close();
    }
    return true;
}

QString FileManager::readFile(const QString& path)
{
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly | QIODevice::Text)) {
        qWarning() << "File open error--#33333333333------" << path;
        return {};
    }
    return QString::fromUtf8(file.readAll()); // ends at the first NUL byte
}
