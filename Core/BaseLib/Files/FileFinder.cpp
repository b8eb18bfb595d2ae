#include "Core/BaseLib/Files/FileFinder.h"

#include "Core/BaseLib/Files/FolderListing.h"
#include "Core/BaseLib/Files/NativeFile.h"
#include "Core/BaseLib/Log/DebugLog.h"

#include <QDir>
#include <QFileInfo>

#include <algorithm>
#include <iterator>
#include <mutex>
#include <set>

namespace {

/// Why there is nothing to search; empty for a folder.
QString reasonAgainst(const QFileInfo &folder)
{
    if (!folder.exists())
        return QStringLiteral("it does not exist");
    if (!folder.isDir())
        return QStringLiteral("it is not a folder");
    return QString();
}

/// The folders that have been reported as unsearchable.
struct Reports {
    std::mutex mutex;
    std::set<QString> folders;
};

Reports &reports()
{
    static Reports instance;
    return instance;
}

void logUnsearchable(const QString &folder, const QString &reason)
{
    if (reason.isEmpty())
        return;
    const std::lock_guard<std::mutex> lock(reports().mutex);
    if (reports().folders.insert(folder).second)
        DebugLog(L"Cannot search the folder \"%ls\": %ls", folder, reason);
}

} // namespace

FileFinder::FileFinder(const QStringList &endings)
    : m_endings(endings)
{}

void FileFinder::forgetReports()
{
    const std::lock_guard<std::mutex> lock(reports().mutex);
    reports().folders.clear();
}

QStringList FileFinder::find(const QString &folder, const QString &ending, const Cancelled &isCancelled)
{
    if (folder.isEmpty()) { // made absolute, it would be the working folder
        logUnsearchable(folder, QStringLiteral("no folder is given"));
        return {};
    }
    const QString start = QDir::cleanPath(QFileInfo(folder).absoluteFilePath());
    const auto [entry, isNew] = m_found.try_emplace(start);
    const bool isWhole = !isNew || searchFolder(start, isCancelled, entry->second);
    QStringList paths;
    std::copy_if(entry->second.begin(), entry->second.end(), std::back_inserter(paths),
                 [&](const QString &path) { return path.endsWith(ending, Qt::CaseInsensitive); });
    if (!isWhole)
        m_found.erase(entry);
    return paths;
}

bool FileFinder::isLookedFor(const QString &name) const
{
    return std::any_of(m_endings.begin(), m_endings.end(),
                       [&](const QString &ending) { return name.endsWith(ending, Qt::CaseInsensitive); });
}

bool FileFinder::searchFolder(const QString &folder, const Cancelled &isCancelled, QStringList &found)
{
    if (isCancelled && isCancelled())
        return false;
    const FolderContent content = listFolder(folder);
    if (!content.problem.isEmpty()) {
        m_unread.append(folder);
        logUnsearchable(folder, content.problem);
    } else if (content.entries.empty()) {
        logUnsearchable(folder, reasonAgainst(QFileInfo(folder)));
    }
    const QString prefix = folder.endsWith(QLatin1Char('/')) ? folder : folder + QLatin1Char('/');
    for (const FolderEntry &entry : content.entries)
        if (isLookedFor(entry.name))
            found.append(prefix + entry.name);
    for (const FolderEntry &entry : content.entries) {
        if (!entry.isRealFolder)
            continue;
        const QString path = prefix + entry.name;
        if (!leadsBack(path) && !searchFolder(path, isCancelled, found))
            return false;
    }
    return true;
}

QStringList findFiles(const QString &folder, const QString &ending)
{
    return FileFinder({ending}).find(folder, ending);
}
