#pragma once

#include "Core/BaseLib/Files/TextFile.h"

#include <QString>

#include <optional>

/// Whether file names that differ only in case name two files.
#ifdef _WIN32
inline constexpr Qt::CaseSensitivity kPathCase = Qt::CaseInsensitive;
#else
inline constexpr Qt::CaseSensitivity kPathCase = Qt::CaseSensitive;
#endif

/// File operations whose system call differs from platform to platform.

/// Whether two paths are spelt alike, but for what file names do not tell apart.
inline bool isSamePath(const QString &left, const QString &right)
{
    return QString::compare(left, right, kPathCase) == 0;
}

/// Orders paths and file names in the same way.
struct PathLess {
    bool operator()(const QString &left, const QString &right) const
    {
        return QString::compare(left, right, kPathCase) < 0;
    }
};

/// Whether a path is that of the folder or of something in it.
inline bool isBelow(const QString &path, const QString &folder)
{
    const int end = folder.endsWith(QLatin1Char('/')) ? folder.size() - 1 : folder.size();
    return path.startsWith(folder, kPathCase) && (path.size() == end || path.at(end) == QLatin1Char('/'));
}

/// The same text for every spelling of a path, for look-ups by hash.
inline QString pathKey(const QString &path)
{
    return kPathCase == Qt::CaseSensitive ? path : path.toCaseFolded();
}

/// Renames a file over an existing one in one step.
FileResult renameOver(const QString &from, const QString &to);
/// Deletes a file; one that does not exist counts as deleted.
FileResult removeFile(const QString &path);
/// Waits until what was written to an open file has reached the disk; a file system that cannot do so is not
/// reported.
void syncToDisk(int fileDescriptor);
/// The path without links that leads to the same file or folder, or, where the system does not tell it, a
/// text that is the same for all paths that lead there. It does not end in "/". None when there is no such
/// file.
std::optional<QString> realPath(const QString &path);
/// True when the system does not let us see whether the file exists, or what kind it is.
bool cannotBeExamined(const QString &path);
/// True for a link to something that is not there, on a drive that is unplugged for example.
bool leadsNowhere(const QString &path);
/// Whether the system reads the name as a device, in any folder and with any ending.
bool isDeviceName(const QString &name);
/// A time in the local time zone.
struct CalendarTime {
    int year, month, day, hour, minute;
};

struct FileStatus {
    bool isRegular; ///< neither a folder nor special
    CalendarTime modified;
};

/// Nothing when the file does not exist. Links are followed.
std::optional<FileStatus> fileStatus(const QString &path);

/// A file's modification time in nanoseconds since 1970, as fine as the file system keeps it; -1 when there
/// is none.
qint64 modifiedNanoseconds(const QString &path);
