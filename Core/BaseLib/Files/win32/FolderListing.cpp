#include "Core/BaseLib/Files/FolderListing.h"

#include "Core/BaseLib/Files/win32/WindowsText.h"

#include <QDirIterator>
#include <QFileInfo>

namespace {

/// Why an existing folder lists nothing; empty when it is merely empty.
QString problemOf(const QString &folder)
{
    WIN32_FIND_DATAW first = {};
    const HANDLE search = FindFirstFileW(nativePath(folder + QStringLiteral("/*")).c_str(), &first);
    if (search != INVALID_HANDLE_VALUE) {
        FindClose(search);
        return QString();
    }
    const DWORD error = GetLastError();
    const bool isGone =
        error == ERROR_FILE_NOT_FOUND || error == ERROR_PATH_NOT_FOUND || error == ERROR_DIRECTORY;
    return isGone ? QString() : systemMessage(error, folder);
}

/// The system also accepts halves of surrogate pairs, which UTF-8 files cannot hold.
bool isText(const QString &name) { return QString::fromUtf8(name.toUtf8()) == name; }

} // namespace

FolderContent readFolder(const QString &folder)
{
    FolderContent content;
    QDirIterator iterator(folder, QDir::AllEntries | QDir::NoDotAndDotDot);
    while (iterator.hasNext()) {
        iterator.next();
        if (!isText(iterator.fileName()))
            continue;
        const QFileInfo info = iterator.fileInfo();
        // A link is told apart first: that needs no look at what it points to.
        content.entries.push_back({iterator.fileName(), !info.isSymLink() && info.isDir()});
    }
    if (content.entries.empty() && QFileInfo(folder).isDir()) // Qt does not give the reason
        content.problem = problemOf(folder);
    return content;
}
