#include "Core/BaseLib/FolderListing.h"

#include <QFile>

#include <memory>

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>

// Not by the toolkit's own means: they ask the system several times for what the folder itself tells.

namespace {

/// The kind of an entry, as the bits of a mode; 0 when it is gone or leads nowhere.
mode_t kindOf(DIR *folder, const dirent &entry, int flags)
{
    struct stat status = {};
    return fstatat(dirfd(folder), entry.d_name, &status, flags) == 0 ? status.st_mode & S_IFMT : 0;
}

mode_t ownKind(DIR *folder, const dirent &entry)
{
    // Not every file system tells it here (readdir(3)).
    return entry.d_type != DT_UNKNOWN ? DTTOIF(entry.d_type) : kindOf(folder, entry, AT_SYMLINK_NOFOLLOW);
}

/// The name as a text; null when it is none.
QString textOf(const dirent &entry)
{
    const QString name = QFile::decodeName(entry.d_name);
    const bool isDoubtful = name.contains(QChar::ReplacementCharacter);
    return isDoubtful && QFile::encodeName(name) != entry.d_name ? QString() : name;
}

} // namespace

std::vector<FolderEntry> readFolder(const QString &folder)
{
    std::vector<FolderEntry> entries;
    const std::unique_ptr<DIR, int (*)(DIR *)> stream(opendir(QFile::encodeName(folder).constData()),
                                                      closedir);
    while (const dirent *entry = stream ? readdir(stream.get()) : nullptr) {
        if (entry->d_name[0] == '.')
            continue;
        const mode_t own = ownKind(stream.get(), *entry);
        const mode_t target = own == S_IFLNK ? kindOf(stream.get(), *entry, 0) : own;
        const QString name = target == S_IFDIR || target == S_IFREG ? textOf(*entry) : QString();
        if (!name.isNull())
            entries.push_back({name, own == S_IFDIR});
    }
    return entries;
}
