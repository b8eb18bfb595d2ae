#pragma once

#include "Main/AudioEngineController/Effects/Host/CatalogueHost.h"
#include "Main/AudioEngineController/Effects/Host/MarkSources.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"

#include <QHash>
#include <QPair>
#include <QSet>

#include <map>
#include <vector>

/// Decides what becomes of each module that a search found, and of what is known of those that it did not
/// find. Pure bookkeeping: nothing is loaded, added or written.
///
/// A file that is not there is *gone* when the folder that it lay in was searched and has other content, or
/// is not below a listed folder any more. It is *away* when that folder is not there, cannot be read or is
/// empty: drives are unplugged. What lies outside the area that was searched stays as it is, but for a file
/// that is not there while one was found that may be it: that counts as gone, or away. In turn a scan of such
/// an area keeps of files that are gone what has marks or crashed: they may have moved to where it did not
/// look.
class ScanPlan {
public:
    /// While the plan is used the host's known list must not change but by crashes. `finder` has searched the
    /// host's folders. `memory` tells which files are copies of others.
    ScanPlan(const CatalogueHost &host, const ProbeMemory &memory, const FileFinder &finder);

    /// Decides about all modules that were found.
    void decide(const QStringList &modules);

    /// Records that stay as they are.
    const std::vector<const EffectRecord *> &kept() const { return m_kept; }
    /// What moves from gone files to files that crashed, in this scan too, or that must not be loaded.
    struct MovedToCrashed {
        std::vector<EffectRecord> records;     ///< changed copies, unless a probed file lists them
        std::map<QString, EffectRecord> marks; ///< by the identifier of the record that gets them
    };
    /// The same, when the known list holds how the probes ended.
    MovedToCrashed movedToCrashed() const;
    /// What is to be probed: known files first, also those that moved, so that of two files with one
    /// identifier the known one wins.
    const std::vector<ScanItem> &items() const { return m_items; }
    /// Files that the user wants never loaded.
    const QStringList &ignored() const { return m_ignored; }
    /// Whether a file lies where nobody looked.
    bool isOutside(const QString &path) const { return !m_area.isWithin(path); }
    /// Records of files that are away. One whose identifier a probed file lists gives way to it.
    const KnownList::Records &away() const { return m_away; }

    /// Records of gone files that stay unless a file that is there lists them.
    const KnownList::Records &orphans() const { return m_orphans; }
    /// The same where it is one of these files that may list them, which nobody asked in this scan.
    KnownList::Records orphansOf(const QStringList &unasked) const;

    /// The sub-plug-ins of an item that are known to have ended the process that probed them, in the version
    /// of the file that is there: they must not be loaded. None where a file ended it as a whole and moved
    /// since: what was disabled beside it did nothing.
    KnownList::Records deadly(const ScanItem &item) const;

    /// Whether something crashed of which no scan has settled yet what may have moved to it.
    bool hasNewCrashes() const { return m_hasNewCrashes; }
    /// Whether files are gone that were known.
    bool hasGone() const { return !m_gone.empty(); }

    /// Whose marks what is newly probed takes over.
    const MarkSources &marks() const { return m_marks; }

    /// A record of a gone file at a path where it is asked again next time.
    static EffectRecord movedUnasked(const EffectRecord &gone, const QString &path);

private:
    struct KnownFile {
        QString path;
        KnownList::Records records;
    };

    /// What became of a gone file.
    struct SettledFile {
        const KnownFile *gone;
        QStringList namesakes;
        QStringList heirs; ///< new files of its name, one of which its records move to
        QString leftAlone; ///< else the one of its name that must not be loaded, to which they move
        bool hasMoved;     ///< to one of these
    };

    bool isNewCrash(const QString &path) const;
    void addCrashedPlugin(const EffectRecord &record);
    void decideModule(const QString &path);
    bool mayBeForgotten(const EffectRecord &first) const;
    void sortMissing(const QSet<QString> &found);
    void collectSought();
    bool isMissing(const QString &path);
    bool isGone(const QString &path);
    bool mayMoveOutside(const QString &path) const;
    void indexKept();
    void settleAllGone(const QStringList &modules);
    void settleGone(const KnownFile &gone, QList<std::size_t> unknown, const QStringList &namesakes);
    void collectOrphans();
    EffectRecord movedIgnored(const EffectRecord &gone, const QString &path) const;
    QString leftAloneOf(const QStringList &namesakes) const;
    void moveToCrashed(const KnownFile &gone, const QStringList &namesakes, MovedToCrashed &all) const;
    /// What becomes of files of which the user switched off all that is known.
    enum class SwitchedOff { StayUnasked, AreAsked };
    void askAgain(const QStringList &paths, SwitchedOff switchedOff);
    bool isKept(const QString &path) const;
    bool isHeld(const RememberedPlugin &plugin) const;
    bool isUnchangedCopy(const ScanItem &item) const;
    void leaveOutCopies();
    void askCopiesOfUnsettled();
    void keep(const KnownList::Records &records);

    const CatalogueHost &m_host;
    const ProbeMemory &m_memory;
    QStringList m_folders; ///< clean
    QStringList m_unread;
    SearchArea m_area;
    MarkSources m_marks;
    QStringList m_ignored;
    bool m_hasNewCrashes;
    std::map<QString, bool> m_isFolderThere; ///< and searched, with some content
    std::vector<const EffectRecord *> m_kept;
    QSet<QString> m_keptPaths;                   ///< by `pathKey`
    QSet<QPair<QString, QString>> m_keptPlugins; ///< path and identifier of those that work
    std::vector<ScanItem> m_items;
    std::vector<KnownFile> m_gone;
    std::vector<SettledFile> m_settled;
    KnownList::Records m_away;
    KnownList::Records m_orphans;
    QSet<QString> m_sought; ///< names and paths of missing files that may have moved here, as keys
    std::map<QString, bool> m_isMissing; ///< by path
};
