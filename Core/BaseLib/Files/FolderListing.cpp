#include "Core/BaseLib/Files/FolderListing.h"

#include <algorithm>

namespace {

/// Without regard to case first. The folded names are made once: folding them at each comparison took most of
/// the processor time of a scan of a large folder.
void sortByName(std::vector<FolderEntry> &entries)
{
    struct Sorted {
        QString folded;
        FolderEntry entry;
    };
    std::vector<Sorted> sorted;
    sorted.reserve(entries.size());
    for (FolderEntry &entry : entries)
        sorted.push_back({entry.name.toCaseFolded(), std::move(entry)});
    std::sort(sorted.begin(), sorted.end(), [](const Sorted &left, const Sorted &right) {
        const int order = left.folded.compare(right.folded);
        return order != 0 ? order < 0 : left.entry.name < right.entry.name;
    });
    std::transform(sorted.begin(), sorted.end(), entries.begin(),
                   [](Sorted &one) { return std::move(one.entry); });
}

} // namespace

FolderContent listFolder(const QString &folder, const MayFollow &mayFollow)
{
    FolderContent content = readFolder(folder, mayFollow);
    if (content.entries.size() > 1) // most folders of a bundle hold one
        sortByName(content.entries);
    return content;
}
