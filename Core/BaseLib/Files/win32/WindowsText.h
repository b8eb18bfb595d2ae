#pragma once

#include <QString>

#include <string>

#include <windows.h>

/// A path as system calls take it: backslashes, and the prefix that lifts the limit of 260 characters where
/// the path is longer. Shorter ones stay as they are: plug-ins see the path under which they were loaded.
std::wstring nativePath(const QString &path);

/// The system's words for an error code, in one line without its end; "%1" in them stands for `subject`.
QString systemMessage(DWORD error, const QString &subject = QString());
