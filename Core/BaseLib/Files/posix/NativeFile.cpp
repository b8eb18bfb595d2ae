#include "Core/BaseLib/Files/NativeFile.h"

#include <QFile>
#include <QFileInfo>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <limits>
#include <memory>

#include <sys/stat.h>
#include <unistd.h>

FileResult renameOver(const QString &from, const QString &to)
{
    if (std::rename(QFile::encodeName(from).constData(), QFile::encodeName(to).constData()) == 0)
        return {};
    return {QString::fromLocal8Bit(std::strerror(errno))};
}

FileResult removeFile(const QString &path)
{
    if (unlink(QFile::encodeName(path).constData()) == 0 || errno == ENOENT)
        return {};
    return {QString::fromLocal8Bit(std::strerror(errno))};
}

std::optional<QString> realPath(const QString &path)
{
    const std::unique_ptr<char, decltype(&std::free)> real(
        realpath(QFile::encodeName(path).constData(), nullptr), &std::free);
    if (!real)
        return std::nullopt;
    return std::strcmp(real.get(), "/") == 0 ? QString() : QFile::decodeName(real.get());
}

bool cannotBeExamined(const QString &path)
{
    struct stat status = {};
    return stat(QFile::encodeName(path).constData(), &status) != 0 && errno != ENOENT && errno != ENOTDIR;
}

bool leadsNowhere(const QString &path)
{
    const QFileInfo file(path);
    return file.isSymLink() && !file.exists();
}

bool isDeviceName(const QString &) { return false; } // devices are files

void syncToDisk(int fileDescriptor) { fsync(fileDescriptor); }

std::optional<FileStatus> fileStatus(const QString &path)
{
    struct stat status = {};
    if (stat(QFile::encodeName(path).constData(), &status) != 0)
        return std::nullopt;
    // Not through Qt, which reads the rules of the time zone again for each file.
    tm local = {};
    localtime_r(&status.st_mtim.tv_sec, &local);
    return FileStatus{S_ISREG(status.st_mode),
                      {local.tm_year + 1900, local.tm_mon + 1, local.tm_mday, local.tm_hour, local.tm_min}};
}

qint64 modifiedNanoseconds(const QString &path)
{
    struct stat status = {};
    if (stat(QFile::encodeName(path).constData(), &status) != 0)
        return -1;
    // 64 bits of nanoseconds end in 2262, file systems later; a time beyond counts as the last one.
    constexpr qint64 kLastSecond = std::numeric_limits<qint64>::max() / 1000000000 - 1;
    const qint64 seconds = std::clamp<qint64>(status.st_mtim.tv_sec, -kLastSecond, kLastSecond);
    return seconds * 1000000000 + status.st_mtim.tv_nsec;
}
