#include "Core/BaseLib/Files/FolderListing.h"

#include "Core/BaseLib/Files/win32/WindowsText.h"

#include <QScopeGuard>

// Not through QDirIterator, which takes shortcuts of the desktop for links and does not tell junctions apart.

namespace {

/// The system also accepts halves of surrogate pairs, which UTF-8 files cannot hold.
bool isText(const QString &name) { return QString::fromUtf8(name.toUtf8()) == name; }

/// Other reparse points are files and folders of cloud storage and the like.
bool isLink(const WIN32_FIND_DATAW &entry)
{
    if ((entry.dwFileAttributes & FILE_ATTRIBUTE_REPARSE_POINT) == 0)
        return false;
    const DWORD tag = entry.dwReserved0;
    return tag == IO_REPARSE_TAG_SYMLINK || tag == IO_REPARSE_TAG_MOUNT_POINT ||
           tag == 0; // NOTE: Wine gives links of the system that it runs on no tag
}

void add(FolderContent &content, const WIN32_FIND_DATAW &entry)
{
    const QString name = QString::fromWCharArray(entry.cFileName);
    const bool isHidden = (entry.dwFileAttributes & FILE_ATTRIBUTE_HIDDEN) != 0;
    if (name == QLatin1String(".") || name == QLatin1String("..") || isHidden)
        return;
    const bool isNamed = isText(name);
    (isNamed ? content.entries : content.unnamed)
        .push_back({isNamed ? name : QString::fromUtf8(name.toUtf8()),
                    (entry.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY) != 0, isLink(entry)});
}

/// Whether nothing could be listed because there is no such folder.
bool isAbsent(const QString &folder, DWORD error)
{
    const DWORD attributes = GetFileAttributesW(nativePath(folder).c_str());
    const bool isFile = attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_DIRECTORY) == 0;
    return isFile || error == ERROR_FILE_NOT_FOUND || error == ERROR_PATH_NOT_FOUND;
}

} // namespace

/// It tells links apart without following them.
FolderContent readFolder(const QString &folder, const MayFollow &)
{
    FolderContent content;
    WIN32_FIND_DATAW entry = {};
    const HANDLE search = FindFirstFileExW(nativePath(folder + QStringLiteral("/*")).c_str(), FindExInfoBasic,
                                           &entry, FindExSearchNameMatch, nullptr, FIND_FIRST_EX_LARGE_FETCH);
    if (search == INVALID_HANDLE_VALUE) {
        if (const DWORD error = GetLastError(); !isAbsent(folder, error))
            content.problem = systemMessage(error, folder);
        return content;
    }
    const auto close = qScopeGuard([search] { FindClose(search); });
    do
        add(content, entry);
    while (FindNextFileW(search, &entry));
    if (const DWORD error = GetLastError(); error != ERROR_NO_MORE_FILES)
        content.problem = systemMessage(error, folder);
    return content;
}
