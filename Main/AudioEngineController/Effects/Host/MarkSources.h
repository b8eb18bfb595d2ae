#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/KnownList.h"

#include <QHash>

/// A module that a scan has to probe.
struct ScanItem {
    QString path;
    QString fileTime;
    KnownList::Records known; ///< of this path, the one that speaks for the file first
    KnownList::Records moved; ///< of a file that is gone, of this file name: they move here, whole
};

/// Tells whose marks a newly probed plug-in takes over: those of the same plug-in, wherever it was known. The
/// records that it is given, and the known list, must outlive it.
class MarkSources {
public:
    explicit MarkSources(const KnownList &known)
        : m_known(known)
    {}

    /// What is known of files that are away.
    void addAway(const KnownList::Records &records);
    /// What is known of a file that is asked, or has moved to one. Of one identifier the first counts.
    void addAsked(const KnownList::Records &records);
    /// A plug-in that has crashed, and lost its identifier to its file's record: a copy may have it.
    void addCrashed(const EffectRecord *record, const QString &id);
    /// What is known of a file that is gone.
    void addGone(const KnownList::Records &records);

    /// The old record whose marks a newly probed one takes over; null when there is none. `isOnly`: the
    /// file lists nothing else.
    const EffectRecord *sourceOf(const ScanItem &item, const EffectRecord &probed, bool isOnly) const;
    /// Where there is none: the record in whose place it came, in a file that moved. Another file may yet
    /// come to list that plug-in.
    const EffectRecord *likelySourceOf(const ScanItem &item, const EffectRecord &probed) const;

private:
    const EffectRecord *unsettled(const EffectRecord &probed) const;
    const EffectRecord *missingChild(const ScanItem &item, const EffectRecord &probed) const;

    const KnownList &m_known;
    KnownList::Records m_away;
    KnownList::Records m_missing;                     ///< away or gone
    QHash<QString, const EffectRecord *> m_unsettled; ///< asked, crashed or gone, by identifier
};
