#pragma once

#include "Main/AudioEngineController/Effects/Host/CatalogueHost.h"
#include "Main/AudioEngineController/Effects/Host/ScanMemory.h"
#include "Main/AudioEngineController/Effects/Host/ScanPlan.h"

#include <QHash>
#include <QSet>

#include <functional>
#include <memory>
#include <set>

class VProgressDisplay;
struct OutcomeRecords;

/// One scan of a host's folders: finds the modules, has those probed that are new or changed, and keeps what
/// they say: passes marks on, adds records, writes catalogues, logs and reports each outcome once. Used once,
/// on the scan worker.
class FolderScan {
    class LocalScan;
    class PooledScan;

public:
    explicit FolderScan(CatalogueHost &host);
    ~FolderScan();
    FolderScan(const FolderScan &) = delete;
    FolderScan &operator=(const FolderScan &) = delete;

    /// Finds the modules and decides which are to be probed. Where there is a pool, it has their jobs from
    /// then on. Never throws.
    void prepare();
    /// The rest; once, after `prepare`. True when the catalogue was written at least once. Never throws.
    bool run();

private:
    bool guard(const std::function<void()> &step) const;
    void endEarly(const char *why) const;
    void plan();
    void scan();
    QStringList findModules() const;
    void keepKnownPaths(QStringList &paths) const;
    void addKept();
    void beginItem(const ScanItem &item);
    void probe(const ScanItem &item);
    bool probeHere();
    void makePool();
    bool probeInPool();
    /// Whether what came of an item is kept.
    bool isSettled(std::size_t item) const { return item < m_done || m_keptAhead.count(item) != 0; }
    /// An outcome as lists and people take it.
    static ProbeOutcome readable(const ScanItem &item, ProbeOutcome outcome);
    ProbeJob jobOf(const ScanItem &item) const;
    bool mayYetBeListed(const EffectRecord &old) const;
    bool isAnyOpenBeside(const QString &path) const;
    void finish(bool isWhole);
    QStringList skippedFiles() const;

    bool keepOutcome(const ScanItem &item, const ProbeOutcome &outcome);
    void log(const ScanItem &item, const ProbeOutcome &outcome, int worker) const;
    bool addListed(const std::vector<EffectRecord> &records);
    bool add(const EffectRecord &record);
    void addLater(EffectRecord record);
    void passMarksToHolder(const EffectRecord &record);
    std::vector<EffectRecord> droppedOf(const ScanItem &item, const OutcomeRecords &records) const;
    void giveUpOthers(const ScanItem &item, const OutcomeRecords &records);
    void forgetGone();
    void listIgnored(const QSet<QString> &settled);

    /// Has interim writes carry what is known of the items from one on, unless they are settled.
    void collectWaiting(std::size_t from);
    void insertFirst(const EffectRecord &record);
    static void takeOut(const EffectRecord &record, WaitingRecords &waiting);
    static void removeWaiting(const ScanItem &item, WaitingRecords &waiting);
    bool writeInterim();
    bool isCancelled() const;

    CatalogueHost &m_host;
    std::shared_ptr<FileFinder> m_finder;
    std::unique_ptr<ScanPlan> m_plan;
    std::shared_ptr<LocalScan> m_local;   ///< where this process asks
    std::shared_ptr<PooledScan> m_pooled; ///< where workers ask
    std::shared_ptr<VProgressDisplay> m_progress;
    ScanMemory m_memory;
    QSet<QString> m_found; ///< the modules, by `pathKey`
    WaitingRecords m_waiting;
    bool m_hasCollected = false;         ///< what waits, for the first interim write
    std::size_t m_done = 0;              ///< items, from the first on
    std::set<std::size_t> m_keptAhead;   ///< items behind them that are done, of a scan that was cancelled
    std::vector<EffectRecord> m_dropped; ///< what files list no more, for interim writes
    std::vector<EffectRecord> m_later;   ///< what files keep that failed, unless another comes to list it
    /// Identifiers, and the old records whose marks they get unless another file lists those.
    std::vector<std::pair<QString, const EffectRecord *>> m_likelyMarks;
    bool m_written = false;

    /// Items by the keys of their file names, made when they are first looked up.
    mutable QHash<QString, std::vector<std::size_t>> m_namesakes;

    EffectRecord m_file;      ///< of the item at hand: path and time
    bool m_isTouched = false; ///< the item at hand has entered its first stage
};
