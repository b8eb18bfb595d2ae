#pragma once

#include <QString>
#include <QStringList>

#include <functional>
#include <map>

/// Finds files and folders by the ends of their names, in a folder and all folders below it. Each folder is
/// read once: all searches of one scan see the same files. Used on one thread.
class FileFinder {
public:
    using Cancelled = std::function<bool()>;

    /// `endings` are the ends of the names looked for, with their dots (".vst3"), compared without regard to
    /// case.
    explicit FileFinder(const QStringList &endings);

    /// The full paths found that end in `ending`, one of the finder's, "/" as separator: those of a folder in
    /// the order of their names, followed by what lies in its sub-folders. A folder that matches is listed
    /// and searched. Hidden entries are skipped and linked folders are not entered; junctions are (people use
    /// them to keep plug-ins on other drives), unless one leads back to a folder around it, so that the
    /// search ends. Names that are not valid text are skipped. A folder that cannot be read, or an empty
    /// path, gives one log line. `isCancelled` is asked before each folder; the search ends early when it
    /// answers true.
    QStringList find(const QString &folder, const QString &ending, const Cancelled &isCancelled = nullptr);

    /// The folders so far of which not all could be read.
    const QStringList &unread() const { return m_unread; }

    /// Folders that cannot be read are reported again from now on.
    static void forgetReports();

private:
    bool isLookedFor(const QString &name) const;
    /// False when it ended early.
    bool searchFolder(const QString &folder, const Cancelled &isCancelled, QStringList &found);

    QStringList m_endings;
    QStringList m_unread;
    std::map<QString, QStringList> m_found; ///< of each folder searched, the paths of all endings
};

/// The paths that a new finder finds.
QStringList findFiles(const QString &folder, const QString &ending);
