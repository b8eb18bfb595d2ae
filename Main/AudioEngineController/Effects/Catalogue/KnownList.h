#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"

#include <map>
#include <vector>

/// How a file is known.
enum class KnownAs {
    Unknown,
    Own,      ///< by its full path
    Moved,    ///< by the name of a file that is gone
    Namesake, ///< by the name of another file that is there, and did not crash: a crash says nothing of a
              ///< namesake
};

/// What the previous catalogue and the surviving crash markers say: records sorted by the file name of their
/// path, those of one file name in the order in which they were filed. Records stay where they are in memory
/// until the list is cleared.
class KnownList {
public:
    using Records = std::vector<const EffectRecord *>;

    void clear() { m_records.clear(); }
    std::size_t size() const { return m_records.size(); }
    bool isEmpty() const { return m_records.empty(); }

    /// Files a record under its file name, unless one with the same file name and identifier is there: the
    /// first wins.
    bool file(const EffectRecord &record);

    /// Applies a crash marker: to the record of the same plug-in, else, for a whole file, to one of the same
    /// file name whose own file is gone, else as a new record. What it applies to becomes disabled and not
    /// working; its identifier is the caller's to set.
    EffectRecord &applyCrash(const EffectRecord &marker);

    /// All records of one full path, the one that speaks for the file first: what crashed as a whole comes
    /// before the others, so that the file is not loaded again because another of its classes sorts before
    /// it; sub-plug-ins that are disabled come last, so that one bad child does not have an unchanged shell
    /// loaded at every scan.
    Records recordsOfPath(const QString &path) const;
    /// The same for all records of a file name, those of the full path before the others.
    Records recordsOfFileName(const QString &path) const;

    /// What the previous catalogue says of a file found in a folder.
    struct Knowledge {
        KnownAs how;
        Records records; ///< the one that speaks for them first
    };
    Knowledge lookUp(const QString &path) const;

    /// True when a record of another plug-in holds the identifier.
    bool isIdHeldByOther(const QString &id, const EffectRecord &plugin) const;

    /// Every record, in the order of the file names.
    Records all() const;

private:
    /// Gives records of a file that is gone the path of one of its name that nothing is known of: the file
    /// was moved, and its marks go with it.
    void followMove(const QString &path);
    EffectRecord *recordForCrash(const EffectRecord &marker);

    std::multimap<QString, EffectRecord, PathLess> m_records;
};
