#include "Core/BaseLib/FolderListing.h"

#include <algorithm>

FolderContent listFolder(const QString &folder)
{
    FolderContent content = readFolder(folder);
    std::sort(content.entries.begin(), content.entries.end(),
              [](const FolderEntry &left, const FolderEntry &right) {
                  const int order = QString::compare(left.name, right.name, Qt::CaseInsensitive);
                  return order != 0 ? order < 0 : left.name < right.name;
              });
    return content;
}

FolderListings::Listing FolderListings::list(const QString &folder)
{
    Listing &listing = m_listings[folder];
    if (!listing) {
        listing = std::make_shared<const FolderContent>(listFolder(folder));
        if (!listing->problem.isEmpty())
            m_unread.append(folder);
    }
    return listing;
}
