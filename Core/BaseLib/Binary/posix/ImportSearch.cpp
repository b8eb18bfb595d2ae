#include "Core/BaseLib/Binary/posix/ImportSearch.h"

#include "Core/BaseLib/Binary/PagedFile.h"
#include "Core/BaseLib/Binary/posix/ElfTables.h"
#include "Core/BaseLib/Files/TextFile.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <map>
#include <memory>

#include <dlfcn.h>

namespace {

bool isLoaded(const QString &name)
{
    void *const handle = dlopen(QFile::encodeName(name).constData(), RTLD_LAZY | RTLD_NOLOAD);
    if (handle)
        dlclose(handle);
    return handle != nullptr;
}

/// Whether the cache of ldconfig has the name. It stands there by itself, or at the end of a path.
bool isInCache(const QByteArray &cache, const QString &name)
{
    const QByteArray text = QFile::encodeName(name) + '\0';
    return cache.contains('\0' + text) || cache.contains('/' + text);
}

/// Searches the folders that are named for one library and those that are loaded with it.
class NamedFolders {
public:
    explicit NamedFolders(const QString &path)
        : m_path(path)
    {}

    /// Empty when it is not there.
    QString find(const QString &name, const QString &neededBy)
    {
        if (name.contains(QLatin1Char('/')))
            return QFileInfo::exists(name) ? name : QString();
        for (const QString &folder : foldersFor(neededBy))
            if (const QString found = QDir(folder).filePath(name); QFileInfo(found).isFile())
                return found;
        return QString();
    }

private:
    /// In the order of the loader (ld.so(8)).
    QStringList foldersFor(const QString &library)
    {
        const ElfNeeds &own = needsOf(library);
        const ElfNeeds &first = needsOf(m_path);
        QStringList folders;
        if (own.folders.isEmpty())
            folders = own.olderFolders + (first.folders.isEmpty() ? first.olderFolders : QStringList());
        folders += qEnvironmentVariable("LD_LIBRARY_PATH").split(QLatin1Char(':'), Qt::SkipEmptyParts);
        return folders + own.folders;
    }

    const ElfNeeds &needsOf(const QString &library)
    {
        const auto [entry, isNew] = m_needs.try_emplace(library);
        if (!isNew)
            return entry->second;
        PagedFile file(library);
        entry->second = readElfNeeds(file.content()).value_or(ElfNeeds());
        // Where the loader was sent, which need not be where a link leads.
        const QString folder = QFileInfo(library).path();
        for (QStringList *folders : {&entry->second.olderFolders, &entry->second.folders})
            folders->replaceInStrings(QStringLiteral("${ORIGIN}"), folder)
                .replaceInStrings(QStringLiteral("$ORIGIN"), folder);
        return entry->second;
    }

    const QString m_path;
    std::map<QString, ElfNeeds> m_needs;
};

/// Folders that the loader searches whether the cache has them or not.
const char *const kSystemFolders[] = {
    "/lib", "/usr/lib", "/lib64", "/usr/lib64", "/lib/x86_64-linux-gnu", "/usr/lib/x86_64-linux-gnu"};

} // namespace

LibrarySearch importSearch(const QString &path)
{
    QByteArray cache;
    readWholeFile(QStringLiteral("/etc/ld.so.cache"), cache);
    const auto named = std::make_shared<NamedFolders>(path);
    return [cache, named](const QString &name, const QString &neededBy) -> std::optional<QString> {
        if (isLoaded(name))
            return QString();
        if (const QString found = named->find(name, neededBy); !found.isEmpty())
            return found;
        if (name.contains(QLatin1Char('/')))
            return std::nullopt;
        if (isInCache(cache, name))
            return QString();
        for (const char *folder : kSystemFolders)
            if (QFileInfo(QDir(QLatin1String(folder)).filePath(name)).isFile())
                return QString();
        return std::nullopt;
    };
}

LibrarySearch namedFolderSearch(const QString &path)
{
    const auto named = std::make_shared<NamedFolders>(path);
    return [named](const QString &name, const QString &neededBy) -> std::optional<QString> {
        const QString found = named->find(name, neededBy);
        return found.isEmpty() || isLoaded(name) ? QString() : found;
    };
}
