#pragma once

#include <QString>

/// A file's last-modified local time as text "yyyy-MM-dd hh:mm"; empty when the file does not exist.
QString fileTimeText(const QString &path);
/// The same; empty also for a folder and for what is special.
QString regularFileTimeText(const QString &path);

/// What tells one version of a file from another: its modification time in full resolution, and its size.
struct FileStamp {
    qint64 modifiedNanoseconds = -1; ///< -1: the file does not exist
    qint64 size = -1;                ///< bytes

    bool operator==(const FileStamp &other) const
    {
        return modifiedNanoseconds == other.modifiedNanoseconds && size == other.size;
    }
    bool operator!=(const FileStamp &other) const { return !(*this == other); }
};

FileStamp fileStamp(const QString &path);

/// Sets the modification time of an existing file to now, in milliseconds; nothing else of it changes.
void touchFile(const QString &path);
