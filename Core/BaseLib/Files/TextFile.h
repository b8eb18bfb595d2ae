#pragma once

#include <QByteArray>
#include <QString>

/// The end of a line in the text files that this program writes: what the platform's text mode gives.
#ifdef _WIN32
inline constexpr char kLineEnd[] = "\r\n";
#else
inline constexpr char kLineEnd[] = "\n";
#endif

/// Whether a written file must have reached the disk when the call returns.
enum class Durability { Buffered, Synced };

/// The outcome of a file operation: an empty reason means success.
struct FileResult {
    QString reason; ///< the system's message for what went wrong
    explicit operator bool() const { return reason.isEmpty(); }
};

/// Replaces a file as a whole, so that a reader sees the old content or the new and a crash leaves one of
/// them: writes a temporary file in the same folder and renames it. Where no temporary file can be made
/// there, or the path leads to a device, it is written directly. A file that exists but is not writable is
/// left alone and reported.
FileResult replaceFile(const QString &path, const QByteArray &content, Durability durability);

/// Reads a whole file into `content`.
FileResult readWholeFile(const QString &path, QByteArray &content);
