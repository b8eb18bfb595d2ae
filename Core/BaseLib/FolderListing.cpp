#include "Core/BaseLib/FolderListing.h"

#include <algorithm>

std::vector<FolderEntry> listFolder(const QString &folder)
{
    std::vector<FolderEntry> entries = readFolder(folder);
    std::sort(entries.begin(), entries.end(), [](const FolderEntry &left, const FolderEntry &right) {
        const int order = QString::compare(left.name, right.name, Qt::CaseInsensitive);
        return order != 0 ? order < 0 : left.name < right.name;
    });
    return entries;
}

std::vector<FolderEntry> FolderListings::list(const QString &folder)
{
    const auto known = m_listings.constFind(folder);
    return known != m_listings.constEnd() ? *known : *m_listings.insert(folder, listFolder(folder));
}
