#pragma once

#include <QString>

#include <functional>
#include <optional>

/// Finds a library by the name under which a file imports it, as the system's loader would: its path. None
/// when the loader would find nothing; an empty path when it is there and known to load.
using LibrarySearch = std::function<std::optional<QString>(const QString &name)>;

/// Tells why the loader refuses a Windows library, which its own message ("The specified module could not be
/// found") does not say: the library, or one that it needs, was built for another machine than x86-64, is
/// damaged or is not there. The answer completes a sentence that starts with the library's name: "needs
/// drums.dll, which is not found". Empty when nothing of this kind is wrong. Libraries that are only loaded
/// when they are used are not looked at.
QString whyNotLoadable(const QString &path, const LibrarySearch &search);
