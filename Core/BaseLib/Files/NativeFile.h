#pragma once

#include "Core/BaseLib/Files/TextFile.h"

#include <QString>

#include <optional>

/// Whether file names that differ in nothing but case are two.
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

/// Orders paths and file names so.
struct PathLess {
    bool operator()(const QString &left, const QString &right) const
    {
        return QString::compare(left, right, kPathCase) < 0;
    }
};

/// The same for every spelling of a path, for what looks paths up by their hashes.
inline QString pathKey(const QString &path)
{
    return kPathCase == Qt::CaseSensitive ? path : path.toCaseFolded();
}

/// Renames a file over an existing one in one step.
FileResult renameOver(const QString &from, const QString &to);
/// Deletes a file; one that is not there is no fault.
FileResult removeFile(const QString &path);
/// Waits until what was written to an open file has reached the disk; systems that cannot do so are not
/// blamed.
void syncToDisk(int fileDescriptor);
/// Whether a folder that is no link is one of those in which it lies, or may be: a junction of Windows leads
/// anywhere, and a search that enters would not end.
bool leadsBack(const QString &folder);
/// True when the system does not let us see whether there is such a file, or what kind it is of.
bool cannotBeExamined(const QString &path);
/// Whether the system takes the name for a device, whatever folder and ending it stands with.
bool isDeviceName(const QString &name);
/// What a moment is called in the local time zone.
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
