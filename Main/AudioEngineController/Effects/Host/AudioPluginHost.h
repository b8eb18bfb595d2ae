#pragma once

#include "Core/BaseLib/Files/FileFinder.h"
#include "Core/BaseLib/Files/FileTime.h"
#include "Core/BaseLib/Process/KriticalSection.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/EffectList.h"
#include "Main/AudioEngineController/Effects/Catalogue/KnownList.h"

#include <QStringList>

#include <atomic>
#include <memory>
#include <optional>
#include <set>

struct LoadedPlugin;

/// Base of the per-format hosts. Holds one format's catalogue: what the previous run left (the known list)
/// and what this run found (the effect list), and reads and writes the files that carry them.
///
/// One thread at a time scans; `effects` may be asked from any thread. The critical section `m_ks` guards the
/// lists and is never held while plug-in code runs.
class AudioPluginHost {
public:
    virtual ~AudioPluginHost() = default;
    AudioPluginHost(const AudioPluginHost &) = delete;
    AudioPluginHost &operator=(const AudioPluginHost &) = delete;

    /// Sets the folder in which the catalogue and the crash markers lie, without a separator at its end.
    void setCatalogueFolder(const QString &folder) { m_catalogueFolder = folder; }
    const QString &catalogueFolder() const { return m_catalogueFolder; }

    /// Reads the previous catalogue into the known list, which is emptied first, and absorbs the crash
    /// markers: the catalogue is rewritten with what they say, and only then are they deleted, so that the
    /// knowledge outlives another crash.
    virtual void ReadCatalogue();
    /// The plug-in folders to scan, as the host application lists them.
    virtual QStringList folders() const;
    /// True when the catalogue file differs from the one seen last: at the last call, or when it was read.
    virtual bool catalogueChanged();
    /// Scans the folders (true) or only refreshes the effect list from the known list (false). `inProcess`
    /// matters to the registry only. True when the catalogue was written.
    virtual bool Scan(bool scan, bool inProcess);
    /// The end of the names of the format's module files, with its dot; empty: it has none.
    virtual QString moduleEnding() const { return QString(); }
    /// Has scans of several formats walk through the folders once; null, as at first: each walks for itself.
    void setFileFinder(std::shared_ptr<FileFinder> finder) { m_fileFinder = std::move(finder); }
    const std::shared_ptr<FileFinder> &fileFinder() const { return m_fileFinder; }
    /// Sets what plug-ins are told about the audio they will be used for.
    virtual void setAudioSettings(int /*sampleRate*/, int /*blockSize*/) {}
    /// Category set of a file to the form used in memory, and back.
    virtual quint32 maskToCategory(quint32 mask) const;
    virtual quint32 categoryToMask(quint32 category) const;

    /// Adds a record to the effect list; true when it was added.
    virtual bool AddEffect(const EffectRecord &record);

    /// Writes the effect list, and with it the records of files still waiting for their probe, to the
    /// catalogue file. A file that cannot be written is logged and stays as it was; false then.
    bool WriteCatalogue(const WaitingRecords &waiting = {}, Durability durability = Durability::Synced);

    /// Writes the crash marker for a plug-in that is about to be touched and gives its full path. A null name
    /// is made from the record's path. A marker that cannot be written is logged; the plug-in is probed
    /// unprotected.
    QString WriteCrashMarker(const EffectRecord &plugin, const QString &name = QString());

    /// Reads a crash marker into a fresh record that is not enabled. The file stays: it is deleted once the
    /// catalogue holds what it said.
    EffectRecord ReadCrashMarker(const QString &marker) const;
    /// Deletes the markers of files that are left alone. Called when the scans of all formats have come to
    /// their ends: until then another crash must not bring those files back.
    void releaseHeldMarkers();

    /// Completes the record of a file, or of a sub-plug-in, that failed to load or lists nothing: named after
    /// the file (a sub-plug-in keeps its name), enabled, not working, so that it is shown and not probed
    /// again until it changes.
    void completeFailedRecord(EffectRecord &record) const;

    /// Loads a plug-in of the effect list by its identifier without the prefix, for use. A host of a format
    /// that is not there knows none.
    virtual LoadedPlugin loadPlugin(const QString &identifier);

    /// A copy of the effect list's record of that identifier; nothing when there is none.
    std::optional<EffectRecord> findEffect(const QString &id) const;
    /// A copy of the effect list's records, in the order of their identifiers.
    std::vector<EffectRecord> effects() const;

    const KnownList &known() const { return m_known; }
    /// True for a file that this run must not touch although nothing is recorded about it.
    bool isLeftAlone(const QString &path) const { return m_leftAlone.count(path) != 0; }
    std::size_t effectCount() const { return m_effects.size(); }
    /// True when the effect list holds a record of the same plug-in under the same identifier.
    bool isListed(const EffectRecord &record) const;
    /// True when the catalogue file holds something else than the known list, being of an earlier version or
    /// of no use.
    bool isCatalogueOutdated() const { return m_catalogueOutdated; }
    /// Whether there is a catalogue that the system did not let us read. It is not replaced.
    bool isCatalogueUnread() const { return !m_unread.isEmpty(); }

    /// Asks a running scan to stop after the current file; any thread. The request stands until it is
    /// cleared.
    void cancel() { m_cancelled = true; }
    bool isCancelled() const { return m_cancelled; }
    /// Forgets an earlier request to stop; the registry does so when a scan starts.
    void clearCancel() { m_cancelled = false; }

    /// Empties the effect list.
    void clearEffects();
    /// Empties the effect list and fills it from the known list.
    void refillEffects();

protected:
    /// `format` describes the catalogue file and must outlive the host; null: the host has none.
    explicit AudioPluginHost(const CatalogueFormat *format = nullptr)
        : m_format(format)
    {}

    const CatalogueFormat *format() const { return m_format; }
    /// The catalogue file's content; what cannot be used is logged.
    CatalogueContents readContents();
    QString cataloguePath() const;
    EffectList &effectList() { return m_effects; }

    /// Whether a crash marker only keeps its file from being touched in this run, without a record.
    virtual bool isMarkerWithoutRecord(const EffectRecord & /*marker*/) const { return false; }

    mutable KriticalSection m_ks;

private:
    void readKnownRecords();
    void absorbMarkers();
    void absorbMarker(const EffectRecord &marker);
    bool writeKnownRecords();
    bool writeRecords(const std::vector<const QByteArray *> &records, Durability durability);
    /// For a plug-in that bears the name for its marker: a path that no marker in use has.
    QString freeMarkerPath(const EffectRecord &plugin) const;
    QString freeIdentifier(const EffectRecord &plugin, const QString &name) const;

    const CatalogueFormat *m_format;
    QString m_catalogueFolder;
    std::shared_ptr<FileFinder> m_fileFinder;
    FileStamp m_lastSeen;
    KnownList m_known;
    EffectList m_effects;
    std::set<QString, PathLess> m_leftAlone;
    QStringList m_heldMarkers; ///< of the files left alone
    bool m_catalogueOutdated = false;
    QString m_unread; ///< why the catalogue that is there could not be read
    std::atomic<bool> m_cancelled{false};
};
