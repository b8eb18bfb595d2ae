#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"

#include <QHash>

#include <algorithm>
#include <deque>
#include <map>
#include <vector>

/// What the previous catalogue and the surviving crash markers say: records that are looked up by the file
/// name of their path, those of one file name in the order in which they were added. Records stay where they
/// are in memory until the list is cleared.
class KnownList {
public:
    using Records = std::vector<const EffectRecord *>;

    /// What tells the plug-ins of one file apart.
    enum class Identity {
        Identifier, ///< every plug-in of a file has one of its own
        SubPlugin,  ///< the sub-plug-in number; the record of number 0 is the file's own
    };

    explicit KnownList(Identity identity = Identity::Identifier)
        : m_identity(identity)
    {}

    Identity identity() const { return m_identity; }
    void clear();
    std::size_t size() const { return m_records.size(); }
    bool isEmpty() const { return m_records.empty(); }

    /// True when both records, of whatever files, stand for the same plug-in of a file.
    bool isSameOfFile(const EffectRecord &left, const EffectRecord &right) const
    {
        return m_identity == Identity::SubPlugin ? left.subId == right.subId : left.id == right.id;
    }

    /// Adds a record, unless one of the same path and identifier is there: the first wins.
    bool addRecord(const EffectRecord &record);

    /// Applies a crash marker. One of a sub-plug-in concerns the record of that path and identifier. One of a
    /// whole file speaks for everything in it: one record stands for the file, which is the one that is given
    /// back, and the file's others become disabled and not working as well, but for those that the user
    /// switched off. Where there is no record, the marker becomes one; its identifier is the caller's to set.
    /// Records of other paths are never touched.
    const EffectRecord &applyCrash(const EffectRecord &marker);
    /// Gives a record of this list another identifier.
    void setIdentifier(const EffectRecord &record, const QString &id);
    /// Has what is listed beside a file that crashed disabled and not working as well: a user, or an earlier
    /// version of this program, may have left it usable. True when something changed.
    bool disableBesideCrashed();

    /// All records of one full path, the one that speaks for the file first: what crashed as a whole comes
    /// before what failed as a whole, and both before the others, so that the file is not loaded again
    /// because another of its classes sorts before it; what else is disabled comes last, so that one bad
    /// child does not have an unchanged shell loaded at every scan, and one class that the user switched off
    /// does not keep an updated module from being asked.
    Records recordsOfPath(const QString &path) const;
    /// The same for all records of a file name, those of the full path before the others.
    Records recordsOfFileName(const QString &path) const;

    /// The first of the records of a file name that is of a plug-in with this identifier, not of a whole
    /// file; null when there is none.
    const EffectRecord *pluginOfFileName(const QString &path, const QString &id) const;
    /// Whether a file has a record of that identifier.
    bool holds(const QString &path, const QString &id) const;
    /// True when a record of another plug-in holds the identifier.
    bool isIdHeldByOther(const QString &id, const EffectRecord &plugin) const;

    /// Every record, in the order of the file names.
    Records all() const;
    /// Every record, in the order in which they were added.
    const std::deque<EffectRecord> &inOrder() const { return m_records; }

private:
    EffectRecord *find(const EffectRecord &marker);
    bool disableOthers(const EffectRecord &crashed);
    EffectRecord &insert(const EffectRecord &record);
    const std::vector<EffectRecord *> &recordsOfId(const QString &id) const;

    Identity m_identity;
    std::deque<EffectRecord> m_records;
    std::multimap<QString, EffectRecord *, PathLess> m_byFileName;
    /// In the order in which they were added: one module may have thousands, and each is looked up when it is
    /// asked again.
    QHash<QString, std::vector<EffectRecord *>> m_byId;
};

/// The first of some records that matches, or null.
template <typename Matches>
const EffectRecord *findRecord(const KnownList::Records &records, Matches &&matches)
{
    const auto found = std::find_if(records.begin(), records.end(),
                                    [&](const EffectRecord *each) { return matches(*each); });
    return found == records.end() ? nullptr : *found;
}
