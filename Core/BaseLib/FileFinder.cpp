#include "Core/BaseLib/FileFinder.h"

#include "Core/BaseLib/DebugLog.h"
#include "Core/BaseLib/NativeFile.h"

#include <QDir>
#include <QFileInfo>

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

/// The folders that were reported as unsearchable already.
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

FileFinder::FileFinder(const QString &ending)
    : m_ending(ending)
{}

void FileFinder::forgetReports()
{
    const std::lock_guard<std::mutex> lock(reports().mutex);
    reports().folders.clear();
}

QStringList FileFinder::find(const QString &folder) const
{
    QStringList found;
    if (folder.isEmpty()) // made absolute, it would be the working folder
        logUnsearchable(folder, QStringLiteral("no folder is given"));
    else
        searchFolder(QDir::cleanPath(QFileInfo(folder).absoluteFilePath()), found);
    return found;
}

void FileFinder::searchFolder(const QString &folder, QStringList &found) const
{
    if (m_cancelled && m_cancelled())
        return;
    const FolderListings::Listing listing = m_listings->list(folder);
    const std::vector<FolderEntry> &entries = listing->entries;
    if (!listing->problem.isEmpty())
        logUnsearchable(folder, listing->problem);
    else if (entries.empty())
        logUnsearchable(folder, reasonAgainst(QFileInfo(folder)));
    const QString prefix = folder.endsWith(QLatin1Char('/')) ? folder : folder + QLatin1Char('/');
    for (const FolderEntry &entry : entries)
        if (entry.name.endsWith(m_ending, Qt::CaseInsensitive))
            found.append(prefix + entry.name);
    for (const FolderEntry &entry : entries)
        if (entry.isRealFolder && !leadsBack(prefix + entry.name))
            searchFolder(prefix + entry.name, found);
}
