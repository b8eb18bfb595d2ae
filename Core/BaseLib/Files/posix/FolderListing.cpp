#include "Core/BaseLib/Files/FolderListing.h"

#include <QFile>

#include <cerrno>

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

// Not through QDirIterator, which asks the system several times for what the folder itself tells.

namespace {

/// Larger than most folders' content, so that one call tells all of it.
constexpr std::size_t kBufferSize = 32768; ///< bytes

/// The kind of an entry, as the bits of a mode; 0 when it is gone or leads nowhere.
mode_t kindOf(int folder, const dirent64 &entry, int flags)
{
    struct stat status = {};
    return fstatat(folder, entry.d_name, &status, flags) == 0 ? status.st_mode & S_IFMT : 0;
}

mode_t ownKind(int folder, const dirent64 &entry)
{
    // Not every file system tells it here (readdir(3)).
    return entry.d_type != DT_UNKNOWN ? DTTOIF(entry.d_type) : kindOf(folder, entry, AT_SYMLINK_NOFOLLOW);
}

/// The name as text; null when it is not valid.
QString textOf(const dirent64 &entry)
{
    const QString name = QFile::decodeName(entry.d_name);
    const bool isDoubtful = name.contains(QChar::ReplacementCharacter);
    return isDoubtful && QFile::encodeName(name) != entry.d_name ? QString() : name;
}

/// The name with its bytes that are not ASCII spelt out.
QString speltOut(const dirent64 &entry)
{
    QString text;
    for (const char *byte = entry.d_name; *byte != '\0'; ++byte)
        text += *byte > 0 ? QString(QLatin1Char(*byte))
                          : QStringLiteral("\\x%1").arg(static_cast<unsigned char>(*byte), 0, 16);
    return text;
}

void add(FolderContent &content, int folder, const dirent64 &entry, const MayFollow &mayFollow)
{
    if (entry.d_name[0] == '.')
        return;
    const mode_t own = ownKind(folder, entry);
    const QString name = textOf(entry);
    if (own == S_IFLNK && mayFollow && !mayFollow(name))
        return;
    const mode_t target = own == S_IFLNK ? kindOf(folder, entry, 0) : own;
    if (target != S_IFDIR && target != S_IFREG)
        return;
    (name.isNull() ? content.unnamed : content.entries)
        .push_back({name.isNull() ? speltOut(entry) : name, target == S_IFDIR, own == S_IFLNK});
}

} // namespace

FolderContent readFolder(const QString &folder, const MayFollow &mayFollow)
{
    FolderContent content;
    const int descriptor = open(QFile::encodeName(folder).constData(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (descriptor < 0) {
        if (errno != ENOENT && errno != ENOTDIR)
            content.problem = qt_error_string(errno);
        return content;
    }
    // Not through opendir, which would allocate a stream for every folder.
    alignas(dirent64) char buffer[kBufferSize];
    ssize_t filled = 0;
    while ((filled = getdents64(descriptor, buffer, sizeof buffer)) > 0)
        for (ssize_t place = 0; place < filled;) {
            const auto *entry = reinterpret_cast<const dirent64 *>(buffer + place);
            add(content, descriptor, *entry, mayFollow);
            place += entry->d_reclen;
        }
    // Names alone may be read of a folder that is closed otherwise: nothing in it can be opened.
    if (filled < 0 || faccessat(descriptor, ".", X_OK, 0) != 0)
        content.problem = qt_error_string(errno);
    close(descriptor);
    return content;
}
