#pragma once

#include "Core/BaseLib/Files/FileFinder.h"
#include "Core/BaseLib/Process/KriticalSection.h"
#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/Protocol/Probe.h"

#include <QStringList>

#include <atomic>
#include <memory>
#include <optional>
#include <vector>

struct LoadedPlugin;
class ProbeMemory;
class ProbePool;

/// Base of the per-format hosts and of their registry. By itself it has no catalogue: it reads, lists and
/// writes nothing. `CatalogueHost` is the base of those that have one.
///
/// One thread at a time scans; `effects` may be asked from any thread.
class AudioPluginHost {
public:
    AudioPluginHost() = default;
    virtual ~AudioPluginHost() = default;
    AudioPluginHost(const AudioPluginHost &) = delete;
    AudioPluginHost &operator=(const AudioPluginHost &) = delete;

    /// Sets the folder in which the catalogue and the crash markers lie, without a separator at its end.
    void setCatalogueFolder(const QString &folder) { m_catalogueFolder = folder; }
    const QString &catalogueFolder() const { return m_catalogueFolder; }

    /// Reads the previous catalogue and absorbs the crash markers.
    virtual void ReadCatalogue() {}
    /// Writes what the host lists to its catalogue file. False when nothing was written.
    virtual bool WriteCatalogue() { return false; }
    /// The plug-in folders to scan, as the host application lists them.
    virtual QStringList folders() const;
    /// True when the catalogue file differs from the one seen last: at the last call, or when it was read.
    virtual bool catalogueChanged() { return false; }
    /// Finds and plans what `Scan` is to probe, so that workers that it does not need meanwhile begin with
    /// it.
    virtual void prepareScan() {}
    /// Scans the folders (true) or only refreshes the effect list from the known list (false). `inProcess`
    /// matters to the registry only. True when the catalogue was written.
    virtual bool Scan(bool /*scan*/, bool /*inProcess*/) { return false; }
    /// Called when the scans of all formats have come to their ends.
    virtual void scansEnded() {}
    /// Adds a record to the effect list; true when it was added.
    virtual bool AddEffect(const EffectRecord & /*record*/) { return false; }
    /// Category set of a file to the form used in memory, and back.
    virtual quint32 maskToCategory(quint32 mask) const;
    virtual quint32 categoryToMask(quint32 category) const;
    /// Sets what plug-ins are told about the audio they will be used for.
    virtual void setAudioSettings(int /*sampleRate*/, int /*blockSize*/) {}

    /// Loads a plug-in of the effect list by its identifier without the prefix, for use. A host of a format
    /// that is not there knows none.
    virtual LoadedPlugin loadPlugin(const QString &identifier);
    /// A copy of the effect list's record of that identifier; nothing when there is none.
    virtual std::optional<EffectRecord> findEffect(const QString & /*id*/) const { return std::nullopt; }
    /// A copy of the effect list's records, in the order of their identifiers.
    virtual std::vector<EffectRecord> effects() const { return {}; }

    /// The time stamp of the file that an update of the module replaces; empty when there is no such module.
    virtual QString moduleTime(const QString & /*path*/) const { return QString(); }
    /// The program library that the system loads for a module; empty when there is none.
    virtual QString moduleLibrary(const QString &path) const { return path; }

    /// What asks the format's modules; null for a format without any.
    virtual std::unique_ptr<IPluginProbe> makeProbe() const { return nullptr; }

    /// Has scans of several formats walk through the folders once; null, as at first: each walks for itself.
    void setFileFinder(std::shared_ptr<FileFinder> finder) { m_fileFinder = std::move(finder); }
    const std::shared_ptr<FileFinder> &fileFinder() const { return m_fileFinder; }
    /// Has scans ask plug-ins in worker processes; null, as at first: in this process.
    void setProbePool(std::shared_ptr<ProbePool> pool) { m_probePool = std::move(pool); }
    const std::shared_ptr<ProbePool> &probePool() const { return m_probePool; }

    /// Has scans of several formats share what is remembered of probes; null, as at first: each reads it.
    void setProbeMemory(std::shared_ptr<ProbeMemory> memory) { m_probeMemory = std::move(memory); }
    const std::shared_ptr<ProbeMemory> &probeMemory() const { return m_probeMemory; }

    /// Asks a running scan to stop after the current file; any thread. The request stands until it is
    /// cleared.
    void cancel() { m_cancelled = true; }
    bool isCancelled() const { return m_cancelled; }
    /// Forgets an earlier request to stop; the registry does so when a scan starts.
    void clearCancel() { m_cancelled = false; }

protected:
    /// Guards the lists; never held while plug-in code runs.
    mutable KriticalSection m_ks;

private:
    QString m_catalogueFolder;
    std::shared_ptr<FileFinder> m_fileFinder;
    std::shared_ptr<ProbePool> m_probePool;
    std::shared_ptr<ProbeMemory> m_probeMemory;
    std::atomic<bool> m_cancelled{false};
};
