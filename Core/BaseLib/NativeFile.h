#pragma once

#include "Core/BaseLib/TextFile.h"

#include <QString>

#include <cstdio>

/// File operations whose system call differs from platform to platform.

/// fopen for a path with any characters; null when it fails.
std::FILE *openStream(const QString &path, const char *mode);
/// Renames a file over an existing one in one step.
FileResult renameOver(const QString &from, const QString &to);
/// Waits until what was written to an open file has reached the disk; systems that cannot do so are not
/// blamed.
void syncToDisk(int fileDescriptor);
/// Sets a file's modification time to now.
void touchFile(const QString &path);
/// A file's modification time in nanoseconds since 1970, as fine as the file system keeps it; -1 when there
/// is none.
qint64 modifiedNanoseconds(const QString &path);
