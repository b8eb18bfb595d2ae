#include "Core/BaseLib/FileFinder.h"

#include "Core/BaseLib/DebugLog.h"
#include "Core/BaseLib/NativeFile.h"

#include <QDir>
#include <QDirIterator>
#include <QFileInfo>

#include <algorithm>
#include <mutex>
#include <set>
#include <vector>

namespace {

struct FolderEntry {
    QString name;
    bool matches;
    bool isRealFolder;
};

std::vector<FolderEntry> listFolder(const QString &folder, const QString &ending)
{
    std::vector<FolderEntry> entries;
    QDirIterator iterator(folder, QDir::AllEntries | QDir::NoDotAndDotDot);
    while (iterator.hasNext()) {
        iterator.next();
        const QString name = iterator.fileName();
        const bool matches = name.endsWith(ending, Qt::CaseInsensitive);
        const QFileInfo info = iterator.fileInfo();
        // A link is told apart first: that needs no look at what it points to.
        const bool isRealFolder = !info.isSymLink() && info.isDir();
        if (matches || isRealFolder)
            entries.push_back({name, matches, isRealFolder});
    }
    std::sort(entries.begin(), entries.end(), [](const FolderEntry &left, const FolderEntry &right) {
        const int order = QString::compare(left.name, right.name, Qt::CaseInsensitive);
        return order != 0 ? order < 0 : left.name < right.name;
    });
    return entries;
}

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
    const std::vector<FolderEntry> entries = listFolder(folder, m_ending);
    if (entries.empty()) {
        const QString reason = reasonAgainst(QFileInfo(folder));
        if (!reason.isEmpty())
            logUnsearchable(folder, reason);
        return;
    }
    const QString prefix = folder.endsWith(QLatin1Char('/')) ? folder : folder + QLatin1Char('/');
    for (const FolderEntry &entry : entries)
        if (entry.matches)
            found.append(prefix + entry.name);
    for (const FolderEntry &entry : entries)
        if (entry.isRealFolder && !leadsBack(prefix + entry.name))
            searchFolder(prefix + entry.name, found);
}
