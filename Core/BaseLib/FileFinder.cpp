#include "Core/BaseLib/FileFinder.h"

#include "Core/BaseLib/DebugLog.h"
#include "Core/BaseLib/NativeFile.h"

#include <QDir>
#include <QFileInfo>

#include <mutex>
#include <set>

namespace {

/// Why a folder cannot be searched; empty when it can.
QString reasonAgainst(const QFileInfo &folder)
{
    if (!folder.exists())
        return QStringLiteral("it does not exist");
    if (!folder.isDir())
        return QStringLiteral("it is not a folder");
    if (!folder.isReadable() || !folder.isExecutable())
        return QStringLiteral("it is not readable");
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
    const std::vector<FolderEntry> &entries = *listing;
    if (entries.empty()) {
        const QString reason = reasonAgainst(QFileInfo(folder));
        if (!reason.isEmpty())
            logUnsearchable(folder, reason);
        return;
    }
    const QString prefix = folder.endsWith(QLatin1Char('/')) ? folder : folder + QLatin1Char('/');
    for (const FolderEntry &entry : entries)
        if (entry.name.endsWith(m_ending, Qt::CaseInsensitive))
            found.append(prefix + entry.name);
    for (const FolderEntry &entry : entries)
        if (entry.isRealFolder && !leadsBack(prefix + entry.name))
            searchFolder(prefix + entry.name, found);
}
