#include "Core/BaseLib/FolderListing.h"

#include <QDirIterator>
#include <QFileInfo>

std::vector<FolderEntry> readFolder(const QString &folder)
{
    std::vector<FolderEntry> entries;
    QDirIterator iterator(folder, QDir::AllEntries | QDir::NoDotAndDotDot);
    while (iterator.hasNext()) {
        iterator.next();
        const QFileInfo info = iterator.fileInfo();
        // A link is told apart first: that needs no look at what it points to.
        entries.push_back({iterator.fileName(), !info.isSymLink() && info.isDir()});
    }
    return entries;
}
