#pragma once

#include "Core/BaseLib/Files/SearchArea.h"

#include <QHash>
#include <QSet>
#include <QString>
#include <QStringList>

#include <chrono>
#include <functional>
#include <memory>
#include <vector>

/// Finds files and folders by the ends of their names, in some folders and all folders below them. Each
/// folder is read once: all searches of one scan see the same files. Used on one thread.
class FileFinder {
public:
    using Cancelled = std::function<bool()>;
    enum class Links { Followed, NotEntered };

    /// Whether what lies at a path is part of something else, and so not looked for itself. Any thread.
    using IsPart = bool (*)(const QString &path);

    /// `endings` are the ends of the names looked for, with their dots (".vst3"), compared without regard to
    /// case; no name has two of them. What `isPart` names is not listed; null: nothing is left out.
    explicit FileFinder(const QStringList &endings, Links links = Links::Followed, IsPart isPart = nullptr);

    /// The full paths found that end in `ending`, one of the finder's, "/" as separator: those of a folder in
    /// the order of their names, followed by what lies in its sub-folders; what only links lead to comes
    /// behind all others. A folder that matches is listed and searched. Hidden entries are skipped, and so
    /// are names that are not valid text. A folder that cannot be read, or an empty path, gives one log line.
    /// `isCancelled` is asked before each folder; the search ends early when it answers true.
    ///
    /// One of `folders` whose own name ends so is listed as well; it may be a file.
    ///
    /// Each real folder is searched once, and each real file listed once for each ending under which it is
    /// reached, by the first path that leads there. A link to one of `folders`, or to a folder around one, is
    /// passed over.
    QStringList find(const QStringList &folders, const QString &ending,
                     const Cancelled &isCancelled = nullptr);

    /// Limits the searches that follow: what lies outside the area is not listed, and no folder is read in
    /// which nothing of it can lie.
    void setArea(const SearchArea &area);
    const SearchArea &area() const { return m_area; }

    /// How long searches wait for a folder, which may lie on a drive whose server is gone, and whom they tell
    /// of one that takes longer than a second, each second anew. `limit` 0: for ever. Without this call a
    /// search waits for ever and tells nobody.
    using Waiting = std::function<void(const QString &folder)>;
    void setPatience(std::chrono::seconds limit, Waiting waiting);

    /// The path under which the last search came upon what this other path leads to as well; null when it
    /// knows of no such path.
    QString foundInsteadOf(const QString &path) const;
    /// Whether there is anything to which more than one path leads, or may lead: a limited search does not
    /// see all links.
    bool hasOtherPaths() const { return !m_otherPaths.empty() || m_area.isLimited(); }

    /// The folders so far of which not all could be read, and links that gave no answer.
    const QStringList &unread() const { return m_unread; }

    /// A path, and why it, or something in it, could not be searched.
    struct Problem {
        QString path;
        QString reason;
    };
    /// What came up in the search, handed out once.
    std::vector<Problem> takeProblems();

    /// Folders that cannot be read are reported again from now on.
    static void forgetReports();

private:
    /// A path, and the one without links that leads to the same. The top of a file system has no real name
    /// that ends in "/".
    struct Place {
        QString path, real;
    };
    struct Link {
        QString path;
        bool isToFolder;
    };
    /// Paths by the keys of the real ones, or of what was listed.
    using Reached = QHash<QString, QString>;

    struct Watch;

    QString endingOf(const QString &path) const;
    bool isLookedFor(const QString &path) const;
    QString listedKey(const QString &real, const QString &path) const;
    bool isPartOfOther(const QString &path) const { return m_isPart && m_isPart(path); }
    void listEntry(const Place &start, const QString &path);
    bool isPassedOver(const QString &path);
    void addProblem(const QString &path, const QString &reason);
    bool searchPatiently(const QStringList &folders, const Cancelled &isCancelled);
    bool waitFor(const std::shared_ptr<Watch> &watch, const Cancelled &isCancelled);
    bool search(const QStringList &folders, const Cancelled &isCancelled);
    std::vector<Place> settleStarts(const QStringList &folders);
    bool searchFolder(const Place &start, const QString &folder, const Cancelled &isCancelled);
    bool wasReached(const Reached &reached, const QString &key, const Place &place);
    bool follow(const Link &link, const Cancelled &isCancelled);
    bool isListed(const Place &place) const;
    void listStarts(const std::vector<Place> &starts);
    bool isListedFile(const Place &start) const;
    bool isInArea(const Place &start, const QString &path) const;
    bool mayHoldSome(const Place &start, const QString &folder) const;
    QString knownByLink(const QString &path) const;
    QString knownAs(const Place &place) const;
    QString searchedAs(const QString &real) const;
    QString searchedInAreaAs(const QString &real) const;

    QStringList m_endings;
    Links m_links;
    IsPart m_isPart;
    SearchArea m_area;
    std::chrono::seconds m_limit{0};
    Waiting m_waiting;              ///< null: nobody waits with patience
    std::shared_ptr<Watch> m_watch; ///< who waits for this search; null: nobody
    QStringList m_silent;           ///< paths that gave no answer in time
    std::vector<Problem> m_problems;
    QStringList m_folders; ///< that were searched last
    QStringList m_found;   ///< in them, of all endings
    QStringList m_unread;
    QStringList m_realFolders; ///< m_folders without links, but for those outside the area
    QStringList m_realOthers;  ///< those
    std::vector<Link> m_met;   ///< links, in the order in which they are followed
    std::vector<Place> m_otherPaths;
    QSet<QString> m_foundKeys; ///< of m_found, where there are other paths
    Reached m_starts;          ///< where searches start: the folders, and those that links lead to
    Reached m_startsMet;       ///< those that another search comes upon; mostly empty, which saves a look-up
    Reached m_listedByLink;    ///< links that are looked for, by `listedKey`
};

/// The paths that a new finder finds in one folder.
QStringList findFiles(const QString &folder, const QString &ending,
                      FileFinder::Links links = FileFinder::Links::Followed);
