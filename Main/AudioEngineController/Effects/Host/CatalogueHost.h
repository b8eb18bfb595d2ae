#pragma once

#include "Core/BaseLib/Files/FileTime.h"
#include "Core/BaseLib/Files/NativeFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/EffectList.h"
#include "Main/AudioEngineController/Effects/Catalogue/KnownList.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/Host/AudioPluginHost.h"
#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"
#include "Main/AudioEngineController/Effects/Protocol/FolderRules.h"

#include <QSet>

#include <functional>
#include <map>
#include <memory>
#include <set>

class FolderScan;

/// Base of the hosts of formats that have a catalogue. Holds what the previous run left (the known list) and
/// what this run found (the effect list), and reads and writes the file that carries them.
class CatalogueHost : public AudioPluginHost {
public:
    /// Reads the previous catalogue into the known list, which is emptied first, and absorbs the crash
    /// markers: the catalogue is rewritten with what they say, and only then are they deleted, so that the
    /// knowledge outlives another crash.
    void ReadCatalogue() override;
    bool catalogueChanged() override;
    void prepareScan() override;
    bool Scan(bool scan, bool inProcess) override;
    bool AddEffect(const EffectRecord &record) override;
    std::optional<EffectRecord> findEffect(const QString &id) const override;
    std::vector<EffectRecord> effects() const override;
    /// Deletes the markers of files that are left alone: until all formats are through, another crash must
    /// not bring those files back.
    void scansEnded() override;

    /// Writes the effect list. A file that cannot be written is logged and stays as it was; false then.
    bool WriteCatalogue() override
    {
        WaitingRecords none;
        return writeInterim(none, Durability::Synced);
    }
    /// Writes the effect list, and with it the records of files still waiting for their probe. An identifier
    /// that is listed already is not written twice.
    bool writeInterim(WaitingRecords &waiting, Durability durability);
    /// Writes the same, unless the file holds exactly that. True when it was written.
    bool writeIfChanged(WaitingRecords &waiting);

    /// Writes the crash marker for a plug-in that is about to be touched. A null name is made from the
    /// record's path.
    CrashMarker WriteCrashMarker(const EffectRecord &plugin, const QString &name = QString()) const;
    /// The same for one of several plug-ins that are probed at once.
    CrashMarker writeSuspectMarker(const EffectRecord &plugin) const;
    /// True for a file that was being probed, with others, when a scanner ended: it is asked first, and
    /// alone.
    bool isSuspect(const QString &path) const { return m_suspects.count(path) != 0; }
    /// Deletes the marker of a suspect that was asked.
    void clearSuspect(const QString &path);
    /// Deletes the markers of suspects that cannot be asked any more.
    void clearSuspects(const std::function<bool(const QString &path)> &mayBeAsked);
    /// Reads a crash marker into a fresh record that is not enabled. The file stays: it is deleted once the
    /// catalogue holds what it said.
    EffectRecord ReadCrashMarker(const QString &marker) const;

    /// Completes the record of a file, or of a sub-plug-in, that failed to load or lists nothing: named after
    /// the file (a sub-plug-in keeps its name), enabled, not working, so that it is shown and not probed
    /// again until it changes.
    void completeFailedRecord(EffectRecord &record) const;

    /// An identifier for the record of a plug-in that crashed or failed: the name, or its path where another
    /// plug-in holds that.
    QString freeIdentifier(const EffectRecord &plugin, const QString &name) const;

    /// Has a known identifier count as free, unless it is listed: its file was asked and does not keep it.
    void giveUp(const QString &id) { m_givenUp.insert(id); }

    PluginFormat format() const { return m_info.format; }
    const PluginFormatInfo &info() const { return m_info; }
    /// The catalogue's full path.
    QString cataloguePath() const;
    const KnownList &known() const { return m_known; }
    /// Has the known list hold what a crash marker says.
    void applyCrash(const EffectRecord &marker);
    /// Whether the known list took over any since it was read.
    bool hasNewCrashes() const { return !m_newCrashes.isEmpty(); }
    /// The same of a file, or of a sub-plug-in in it.
    bool hasNewCrash(const QString &path) const { return m_newCrashes.contains(pathKey(path)); }
    /// True for a file that this run must not touch although nothing is recorded about it.
    bool isLeftAlone(const QString &path) const { return m_leftAlone.count(path) != 0; }
    /// True when the effect list holds the identifier.
    bool isListed(const QString &id) const;
    /// What the user wants left alone, as it stood when the catalogue was read.
    const FolderRules &rules() const { return m_rules; }
    /// Whether there is a catalogue that the system did not let us read. It is not replaced.
    bool isCatalogueUnread() const { return !m_unread.isEmpty(); }
    /// Whether the last attempt to write the catalogue came to nothing.
    bool hasFailedToWrite() const { return m_hasFailedToWrite; }

    /// Has a listed record take over the user's marks of an old one.
    void passMarks(const EffectRecord &old, const QString &id);

    /// Has written catalogues leave a listed record out, or hold it again. A next run asks a file anew of
    /// which nothing is recorded.
    void setHidden(const QString &id, bool isHidden);
    /// Has them hold a listed record so that a next run asks its file anew, or as it is.
    void setUnsettled(const QString &id, bool isUnsettled);

    /// Empties the effect list.
    void clearEffects();
    /// Empties the effect list and fills it from the known list.
    void refillEffects();

    /// What a format knows of its modules on disk. The defaults are those of a format whose modules are plain
    /// files.
    ///
    /// False for a path that a folder search finds although it is not a module of its own.
    virtual bool isModule(const QString &path) const
    {
        return !isBelowBundle(path); // what lies there is of the bundle's format
    }
    QString moduleTime(const QString &path) const override;
    /// The folder in which a module lies: that of its bundle, if it is inside one.
    virtual QString moduleFolder(const QString &path) const;
    /// What a user reads while it is probed.
    virtual QString displayName(const QString &path) const { return fileNameOf(path); }
    /// Whether modules are probed in the order of their paths, not in that of the folders.
    virtual bool probesInPathOrder() const { return true; }
    /// Whether the user interface hears of each record that is added, or once of each file.
    virtual bool announcesEachRecord() const { return true; }
    /// Whether a crash marker only keeps its file from being touched in this run, without a record.
    virtual bool isMarkerWithoutRecord(const EffectRecord & /*marker*/) const { return false; }

protected:
    explicit CatalogueHost(PluginFormat format);

    /// The catalogue file's content; what cannot be used is logged.
    CatalogueContents readContents();
    EffectList &effectList() { return m_effects; }

private:
    void readKnownRecords();
    QStringList takenMarkers() const;
    void absorbMarkers();
    bool absorbMarker(const EffectRecord &marker);
    void rememberCrashes(const std::vector<EffectRecord> &markers) const;
    bool writeKnownRecords();
    QByteArray render(WaitingRecords &waiting);
    bool writeText(const QByteArray &text, Durability durability);
    bool matchesFile() const;

    const PluginFormatInfo &m_info;
    std::shared_ptr<FolderScan> m_scan; ///< prepared, until it has run
    FileStamp m_lastSeen;
    FolderRules m_rules;
    KnownList m_known;
    EffectList m_effects;
    std::set<QString, PathLess> m_leftAlone;
    std::map<QString, QString, PathLess> m_suspects; ///< path to marker
    std::set<QString> m_givenUp;                     ///< known identifiers
    QStringList m_heldMarkers;                       ///< of files left alone
    QStringList m_unwrittenMarkers; ///< absorbed, but what they say could not be written down
    QByteArray m_written;       ///< what this process wrote to the file last; null: nothing since it was read
    QSet<QString> m_newCrashes; ///< files, by `pathKey`
    bool m_isKnownAsRead = false; ///< the file holds exactly the known list, in our layout
    bool m_hasFailedToWrite = false;
    QString m_unread; ///< why the catalogue that is there could not be read
};
