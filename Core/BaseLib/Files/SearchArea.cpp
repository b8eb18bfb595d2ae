#include "Core/BaseLib/Files/SearchArea.h"

#include "Core/BaseLib/Files/AnswerInTime.h"
#include "Core/BaseLib/Files/NativeFile.h"

#include <QDir>
#include <QFileInfo>

#include <algorithm>

namespace {

QString realOf(const QString &path);

/// The path without the links that lead to its folder.
QString realFolderAndName(const QString &path)
{
    const QFileInfo file(path);
    return file.path() == path ? path : realOf(file.path()) + QLatin1Char('/') + file.fileName();
}

/// Where a path leads when the links in its existing part are followed.
QString realOf(const QString &path)
{
    const std::optional<QString> real = realPath(path);
    return real ? *real : realFolderAndName(path);
}

} // namespace

bool isBelowAny(const QString &path, const QStringList &others)
{
    return std::any_of(others.begin(), others.end(),
                       [&](const QString &other) { return isBelow(path, other); });
}

SearchArea::SearchArea(const QStringList &only, const QStringList &excluded)
    : m_excluded(excluded)
{
    for (const QString &path : only)
        m_only += spellings(path);
}

QStringList SearchArea::spellings(const QString &path)
{
    if (path.isEmpty()) // made absolute, it would be the working folder
        return {};
    const QString given = QDir::cleanPath(QFileInfo(path).absoluteFilePath());
    if (!answers(given))
        return {given};
    QStringList all{given, realFolderAndName(given), realOf(given)};
    all.removeDuplicates();
    return all;
}

bool SearchArea::isWithin(const QString &path) const { return m_only.isEmpty() || isBelowAny(path, m_only); }

bool SearchArea::isExcluded(const QString &path) const { return isBelowAny(path, m_excluded); }

bool SearchArea::mayHoldSome(const QString &folder) const
{
    const auto isOnTheWay = [&](const QString &path) { return isBelow(path, folder); };
    return !isExcluded(folder) && (isWithin(folder) || std::any_of(m_only.begin(), m_only.end(), isOnTheWay));
}
