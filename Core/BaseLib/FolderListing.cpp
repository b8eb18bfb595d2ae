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

FolderListings::Listing FolderListings::list(const QString &folder)
{
    Listing &listing = m_listings[folder];
    if (!listing)
        listing = std::make_shared<const std::vector<FolderEntry>>(listFolder(folder));
    return listing;
}
