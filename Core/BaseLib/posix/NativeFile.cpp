#include "Core/BaseLib/NativeFile.h"

#include <QFile>

#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

std::FILE *openStream(const QString &path, const char *mode)
{
    return std::fopen(QFile::encodeName(path).constData(), mode);
}

FileResult renameOver(const QString &from, const QString &to)
{
    if (std::rename(QFile::encodeName(from).constData(), QFile::encodeName(to).constData()) == 0)
        return {};
    return {QString::fromLocal8Bit(std::strerror(errno))};
}

void syncToDisk(int fileDescriptor) { fsync(fileDescriptor); }

void touchFile(const QString &path) { utimensat(AT_FDCWD, QFile::encodeName(path).constData(), nullptr, 0); }

qint64 modifiedNanoseconds(const QString &path)
{
    struct stat status = {};
    if (stat(QFile::encodeName(path).constData(), &status) != 0)
        return -1;
    return status.st_mtim.tv_sec * qint64(1000000000) + status.st_mtim.tv_nsec;
}
