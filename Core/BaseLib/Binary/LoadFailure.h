#pragma once

#include <QString>

#include <functional>
#include <optional>

/// Finds a library by the name under which another one, at a path, imports it, as the system's loader would:
/// its path. None when the loader would find nothing; an empty path when it is there and known to load.
using LibrarySearch = std::function<std::optional<QString>(const QString &name, const QString &neededBy)>;

/// How every text of `whyNotLoadable` begins.
inline constexpr char kNeedsLibrary[] = "it needs ";

/// How the reasons begin that `inspectModule` gives for a file that is built for another machine or system,
/// is not whole, is empty, or cannot be read; and that of a bundle without a module for this machine.
inline constexpr char kBuiltFor[] = "it is built for ";
inline constexpr char kBundleFor[] = "the bundle has modules for ";
inline constexpr char kBundleHas[] = "the bundle has "; ///< also of one with none at all, or with several
inline constexpr char kBundleClosed[] = "its folder Contents cannot be searched: ";
inline constexpr char kUnopened[] = "it cannot be opened: ";
inline constexpr char kCutShort[] = "it is cut short";
inline constexpr char kEmptyFile[] = "it is empty";

/// Tells why the loader refuses a library that is built for this machine, which its own message does not say
/// or only in part: libraries that it needs, or that those need, are not there or not for this machine. "it
/// needs drums.dll and bass.dll, which are not installed". Empty when nothing of this kind is wrong.
/// Libraries that are only loaded when they are used are not looked at.
QString whyNotLoadable(const QString &path, const LibrarySearch &search);

/// Names a needed library that is found and cut short: "it needs drums.dll, which is cut short: …". Empty
/// when none is.
QString whyCutShort(const QString &path, const LibrarySearch &search);
