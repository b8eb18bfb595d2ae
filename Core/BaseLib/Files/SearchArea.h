#pragma once

#include <QString>
#include <QStringList>

/// The part of the file system that a search is about: what lies at or below some paths, without what lies at
/// or below some others. It asks the system when it is made and never again: a drive that gives no answer
/// would hold up whoever asks about a path on it.
class SearchArea {
public:
    /// Everything.
    SearchArea() = default;
    /// `only` are the files and folders to search; none: all. `excluded` are never searched, also inside
    /// these; they are taken as they are spelt, each with all its `spellings`.
    SearchArea(const QStringList &only, const QStringList &excluded);

    /// The paths by which the same is reached: as given, absolute; with the links to its folder followed; and
    /// what it leads to. Only the first of one that gives no answer.
    static QStringList spellings(const QString &path);

    bool isEverything() const { return m_only.isEmpty() && m_excluded.isEmpty(); }
    /// Whether some paths only are searched.
    bool isLimited() const { return !m_only.isEmpty(); }

    /// Whether a path belongs to it, but for what is excluded.
    bool isWithin(const QString &path) const;
    bool isExcluded(const QString &path) const;
    bool contains(const QString &path) const { return isWithin(path) && !isExcluded(path); }
    /// Whether something that belongs to it may lie in a folder, or further below.
    bool mayHoldSome(const QString &folder) const;

private:
    QStringList m_only; ///< in all spellings
    QStringList m_excluded;
};

/// Whether a path lies at or below one of some others.
bool isBelowAny(const QString &path, const QStringList &others);
