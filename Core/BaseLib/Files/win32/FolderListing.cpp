#include "Core/BaseLib/Files/FolderListing.h"

#include "Core/BaseLib/Files/win32/WindowsText.h"

#include <QScopeGuard>

// Not through QDirIterator, which takes shortcuts of the desktop for links and does not tell junctions apart.

namespace {

/// The system also accepts halves of surrogate pairs, which UTF-8 files cannot hold.
bool isText(const QString &name) { return QString::fromUtf8(name.toUtf8()) == name; }

/// What leads elsewhere; other reparse points are files and folders of cloud storage and the like.
bool isLink(const WIN32_FIND_DATAW &entry)
{
    return (entry.dwFileAttributes & FILE_ATTRIBUTE_REPARSE_POINT) != 0 &&
           (entry.dwReserved0 == IO_REPARSE_TAG_SYMLINK || entry.dwReserved0 == IO_REPARSE_TAG_MOUNT_POINT);
}

void add(std::vector<FolderEntry> &entries, const WIN32_FIND_DATAW &entry)
{
    const QString name = QString::fromWCharArray(entry.cFileName);
    const bool isHidden = (entry.dwFileAttributes & FILE_ATTRIBUTE_HIDDEN) != 0;
    if (name == QLatin1String(".") || name == QLatin1String("..") || isHidden || !isText(name))
        return;
    entries.push_back({name, (entry.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY) != 0, isLink(entry)});
}

bool isAbsence(DWORD error)
{
    return error == ERROR_FILE_NOT_FOUND || error == ERROR_PATH_NOT_FOUND || error == ERROR_DIRECTORY;
}

} // namespace

FolderContent readFolder(const QString &folder)
{
    FolderContent content;
    WIN32_FIND_DATAW entry = {};
    const HANDLE search = FindFirstFileExW(nativePath(folder + QStringLiteral("/*")).c_str(), FindExInfoBasic,
                                           &entry, FindExSearchNameMatch, nullptr, FIND_FIRST_EX_LARGE_FETCH);
    if (search == INVALID_HANDLE_VALUE) {
        if (const DWORD error = GetLastError(); !isAbsence(error))
            content.problem = systemMessage(error, folder);
        return content;
    }
    const auto close = qScopeGuard([search] { FindClose(search); });
    do
        add(content.entries, entry);
    while (FindNextFileW(search, &entry));
    if (const DWORD error = GetLastError(); error != ERROR_NO_MORE_FILES)
        content.problem = systemMessage(error, folder);
    return content;
}
