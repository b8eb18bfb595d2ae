#include "Core/BaseLib/Binary/posix/ImportSearch.h"

#include "Core/BaseLib/Binary/PagedFile.h"
#include "Core/BaseLib/Binary/posix/ElfTables.h"
#include "Core/BaseLib/Files/TextFile.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

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

QStringList foldersFor(const QString &path)
{
    PagedFile file(path);
    QStringList folders = readElfNeeds(file.content()).value_or(ElfNeeds()).folders;
    const QString own = QFileInfo(QFileInfo(path).canonicalFilePath()).path();
    folders.replaceInStrings(QStringLiteral("${ORIGIN}"), own)
        .replaceInStrings(QStringLiteral("$ORIGIN"), own);
    folders += qEnvironmentVariable("LD_LIBRARY_PATH").split(QLatin1Char(':'), Qt::SkipEmptyParts);
    return folders;
}

/// Folders that the loader searches whether the cache has them or not.
const char *const kSystemFolders[] = {
    "/lib", "/usr/lib", "/lib64", "/usr/lib64", "/lib/x86_64-linux-gnu", "/usr/lib/x86_64-linux-gnu"};

} // namespace

LibrarySearch importSearch(const QString &path)
{
    QByteArray cache;
    readWholeFile(QStringLiteral("/etc/ld.so.cache"), cache);
    return [cache, folders = foldersFor(path)](const QString &name) -> std::optional<QString> {
        if (name.contains(QLatin1Char('/')))
            return QFileInfo::exists(name) ? std::make_optional(name) : std::nullopt;
        for (const QString &folder : folders)
            if (const QString found = QDir(folder).filePath(name); QFileInfo(found).isFile())
                return found;
        if (isLoaded(name) || isInCache(cache, name))
            return QString();
        for (const char *folder : kSystemFolders)
            if (QFileInfo(QDir(QLatin1String(folder)).filePath(name)).isFile())
                return QString();
        return std::nullopt;
    };
}
