#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Host/FolderScan.h"
#include "Main/AudioEngineController/Effects/Host/OutcomeRecords.h"
#include "Main/AudioEngineController/Effects/Host/ProbePool.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanControl.h"
#include "Main/VLib/SimpleGUI.h"
#include "Main/VLib/VProgressDisplay.h"

#include <QElapsedTimer>
#include <QFileInfo>

#include <algorithm>
#include <map>

// A scan whose plug-ins are asked by workers, several at once. What is kept is decided in the order of the
// items, whatever the order in which they end.

namespace {

constexpr qint64 kWritePause = 100; ///< ms between two interim catalogues

} // namespace

class FolderScan::PooledScan : public IPoolListener {
public:
    explicit PooledScan(FolderScan &scan)
        : m_scan(scan)
        , m_items(scan.m_plan->items())
        , m_states(m_items.size())
        , m_probe(scan.m_host.makeProbe())
        , m_pool(scan.m_host.probePool())
    {}
    ~PooledScan() override
    {
        m_pool->withdraw(*this);
        for (const std::size_t item : m_verdicts)
            m_states[item].marker.leave(); // nothing else holds it
    }
    PooledScan(const PooledScan &) = delete;
    PooledScan &operator=(const PooledScan &) = delete;

    /// Hands the jobs to the pool.
    void begin()
    {
        std::vector<PoolJob> jobs;
        for (std::size_t item = 0; item < m_items.size(); ++item) {
            // Those that were at work when a scanner ended: what ends a scanner that asks nobody else is the
            // culprit.
            m_states[item].isAlone = m_scan.m_host.isSuspect(m_items[item].path);
            m_places.emplace(m_items[item].path, item);
            for (const EffectRecord *moved : m_items[item].moved)
                m_places.emplace(moved->path, item);
            jobs.push_back({m_scan.jobOf(m_items[item]), isAlone(item), expectedMs(item)});
        }
        m_pool->add(std::move(jobs), *this);
    }
    /// False when not all were asked: the scan was cancelled.
    bool run();

    std::optional<ProbeOutcome> look(std::size_t item) override
    {
        if (isSkipped(item))
            return ProbeOutcome::skipped();
        return m_probe->look(m_scan.jobOf(m_items[item]));
    }
    void jobBegins(std::size_t item, int worker) override;
    void stageEntered(std::size_t item, int worker, ProbeStage stage) override;
    void classBegins(std::size_t item, int worker, const QString &name) override;
    void classAnnounced() override { notifyUI(MessageCode::kEntryAdded); }
    void childBegins(std::size_t item, int worker, const EffectRecord &child) override;
    void childEnds(std::size_t item, int worker, const ProbeOutcome &outcome) override;
    void jobEnds(std::size_t item, int worker, const ProbeOutcome &outcome) override;
    void becomesLongest(std::size_t item) override { showScanning(m_states[item].shown); }
    void turn() override { writeInterim(); }
    void workerEnds(int worker, const QString &reason) override
    {
        ProbeReport::instance().workerEnded(worker, reason);
    }
    bool isCancelled() override { return m_scan.isCancelled(); }
    bool isSkipped(std::size_t item) override
    {
        return ScanControl::instance().isSkipped(m_items[item].path);
    }

private:
    /// An item, as far as it came.
    struct State {
        bool isAlone = false; ///< asked while nothing else is at work
        CrashMarker marker;
        bool isTouched = false;
        QString shown; ///< what of it a user reads now
        EffectRecord child;
        std::map<quint32, QString> childReasons;
        std::map<quint32, QStringList> childFrames; ///< of those that crashed
        std::optional<ProbeOutcome> outcome;        ///< that is not kept yet
        bool isHeldBack = false;                    ///< what came of it is among what waits
        std::vector<EffectRecord> pending;          ///< its records there
    };

    double expectedMs(std::size_t item) const;
    EffectRecord fileOf(std::size_t item) const;
    void show(std::size_t item, const QString &text);
    void showProgress();
    bool isAlone(std::size_t item) const { return m_states[item].isAlone; }
    void holdBack(std::size_t item);
    bool isOfOtherItem(const QString &id, std::size_t item) const;
    void keep(std::size_t index);
    void keepInOrder();
    void keepAhead();
    void probeRest();
    void writeInterim();
    void settleVerdicts();

    FolderScan &m_scan;
    const std::vector<ScanItem> &m_items;
    std::vector<State> m_states;
    const std::unique_ptr<IPluginProbe> m_probe; ///< looks at files; workers ask plug-ins
    const std::shared_ptr<ProbePool> m_pool;
    std::map<QString, std::size_t, PathLess> m_places; ///< items by their paths, also those that they had
    QElapsedTimer m_sinceWrite;
    bool m_owesWrite = false;            ///< something came since
    std::vector<std::size_t> m_verdicts; ///< items whose markers stay until a catalogue on disk blames them
};

bool FolderScan::PooledScan::run()
{
    showProgress();
    if (!m_pool->run(*this))
        probeRest();
    const bool isWhole = !m_scan.isCancelled() && m_scan.m_done == m_items.size();
    if (!isWhole)
        keepAhead();
    if (!m_verdicts.empty())
        settleVerdicts();
    return isWhole;
}

/// How long a module will take: as long as last time. One that was never asked is judged by its size, which
/// tells where much is to be prepared.
double FolderScan::PooledScan::expectedMs(std::size_t item) const
{
    constexpr double kBytesPerMs = 40000; // of ZamVerb, the slowest of Debian's plug-ins for its size
    const QString &path = m_items[item].path;
    const RememberedProbe *last = m_scan.m_memory.probes().find(m_scan.m_host.format(), path);
    if (last && last->milliseconds > 0)
        return last->milliseconds;
    return static_cast<double>(QFileInfo(m_scan.m_host.moduleLibrary(path)).size()) / kBytesPerMs;
}

/// Without workers this process asks what is left.
void FolderScan::PooledScan::probeRest()
{
    while (m_scan.m_done < m_items.size() && !m_scan.isCancelled()) {
        m_states[m_scan.m_done].marker.remove();
        m_scan.probe(m_items[m_scan.m_done]);
        ++m_scan.m_done;
        keepInOrder();
    }
}

EffectRecord FolderScan::PooledScan::fileOf(std::size_t item) const
{
    EffectRecord file;
    file.path = m_items[item].path;
    file.fileTime = m_items[item].fileTime;
    return file;
}

void FolderScan::PooledScan::show(std::size_t item, const QString &text)
{
    m_states[item].shown = text;
    if (m_pool->isLongest(*this, item))
        showScanning(text);
}

void FolderScan::PooledScan::showProgress()
{
    if (!m_scan.m_progress)
        return;
    m_scan.m_progress->setRange(static_cast<int>(m_pool->added()), QString());
    m_scan.m_progress->setValue(static_cast<int>(m_pool->ended()));
}

void FolderScan::PooledScan::jobBegins(std::size_t item, int)
{
    State &state = m_states[item];
    if (!m_scan.m_hasCollected) // most scans find nothing to ask
        m_scan.collectWaiting(m_scan.m_done);
    if (state.marker.path().isEmpty())
        state.marker = isAlone(item) ? m_scan.m_host.WriteCrashMarker(fileOf(item))
                                     : m_scan.m_host.writeSuspectMarker(fileOf(item));
}

void FolderScan::PooledScan::stageEntered(std::size_t item, int worker, ProbeStage stage)
{
    if (stage == ProbeStage::Load || !m_states[item].isTouched) {
        m_states[item].isTouched = true;
        DebugTrace(L"Probing %ls", m_items[item].path);
        show(item, m_scan.m_host.displayName(m_items[item].path));
        ProbeReport::instance().begin(m_scan.m_host.format(), fileOf(item), worker);
    }
    ProbeReport::instance().stage(stage, worker);
}

void FolderScan::PooledScan::classBegins(std::size_t item, int, const QString &name)
{
    m_states[item].marker.refresh();
    show(item, name);
}

void FolderScan::PooledScan::childBegins(std::size_t item, int worker, const EffectRecord &child)
{
    m_states[item].marker.refresh();
    m_states[item].child = child;
    show(item, child.subName);
    ProbeReport::instance().begin(m_scan.m_host.format(), child, worker);
}

void FolderScan::PooledScan::childEnds(std::size_t item, int worker, const ProbeOutcome &outcome)
{
    State &state = m_states[item];
    const EffectRecord child = outcome.records.empty() ? state.child : outcome.records.front();
    if (!outcome.reason.isEmpty())
        DebugLog(L"%ls, %ls: %ls", child.path, child.subName, outcome.reason);
    // One that ends its worker while it is being closed has ended before.
    if (state.childReasons.count(child.subId) == 0 || !outcome.reason.isEmpty())
        ProbeReport::instance().end(m_scan.m_host.format(), child, outcome, worker);
    state.childReasons[child.subId] = outcome.reason;
    state.childFrames[child.subId] = outcome.frames;
}

void FolderScan::PooledScan::jobEnds(std::size_t item, int worker, const ProbeOutcome &outcome)
{
    State &state = m_states[item];
    if (outcome.status == ProbeStatus::Cancelled) { // nobody is to blame
        state.marker.remove();
        return;
    }
    m_scan.beginItem(m_items[item]);
    m_scan.m_isTouched = state.isTouched;
    state.outcome = readable(m_items[item], outcome);
    m_scan.log(m_items[item], *state.outcome, worker);
    const bool isVerdict = isCrash(outcome.status);
    if (isVerdict)
        m_scan.m_memory.addCrash(m_scan.m_file, *state.outcome);
    if (item == m_scan.m_done)
        keepInOrder();
    else
        holdBack(item);
    showProgress();
    if (isVerdict) {
        m_verdicts.push_back(item);
    } else {
        state.marker.remove();
        m_scan.m_host.clearSuspect(m_items[item].path);
    }
    m_owesWrite |= isVerdict || state.isTouched; // what was only looked at can wait for the last write
    writeInterim();
}

/// Has interim writes carry what came of an item before those ahead of it have ended; unless whose marks it
/// gets is not settled, or another item waits with what it lists, whose marks would be lost with this
/// process.
void FolderScan::PooledScan::holdBack(std::size_t item)
{
    State &state = m_states[item];
    OutcomeRecords records = recordsOfOutcome(m_scan.m_host, *m_scan.m_plan, m_items[item], *state.outcome);
    const auto isOthers = [&](const EffectRecord &record) { return isOfOtherItem(record.id, item); };
    if (!records.likelyMarks.empty() || std::any_of(records.listed.begin(), records.listed.end(), isOthers))
        return;
    state.isHeldBack = true;
    removeWaiting(m_items[item], m_scan.m_waiting);
    state.pending = m_scan.droppedOf(m_items[item], records);
    state.pending.insert(state.pending.end(), records.listed.begin(), records.listed.end());
    state.pending.insert(state.pending.end(), records.kept.begin(), records.kept.end());
    for (const EffectRecord &record : state.pending)
        m_scan.insertFirst(record);
}

/// Whether another item waits with an identifier: it is known of it, or came of it.
bool FolderScan::PooledScan::isOfOtherItem(const QString &id, std::size_t item) const
{
    const auto [first, last] = m_scan.m_waiting.equal_range(id);
    return std::any_of(first, last, [&](const auto &waiting) {
        const auto other = m_places.find(waiting.second.record.path);
        return other != m_places.end() && other->second != item;
    });
}

void FolderScan::PooledScan::keep(std::size_t index)
{
    State &state = m_states[index];
    const ScanItem &item = m_items[index];
    for (const EffectRecord &record : state.pending)
        takeOut(record, m_scan.m_waiting);
    m_scan.beginItem(item);
    m_scan.m_isTouched = state.isTouched;
    for (const auto &[subId, reason] : state.childReasons)
        m_scan.m_memory.childEnded(subId, reason, state.childFrames[subId]);
    m_scan.m_memory.end(m_scan.m_file, *state.outcome, m_scan.m_isTouched);
    m_scan.keepOutcome(item, *state.outcome);
    state.outcome.reset();
    state.pending.clear();
}

/// Keeps the outcomes up to the first item that has none yet.
void FolderScan::PooledScan::keepInOrder()
{
    for (; m_scan.m_done < m_items.size() && m_states[m_scan.m_done].outcome; ++m_scan.m_done)
        keep(m_scan.m_done);
}

/// Keeps the outcomes behind those that a cancel cut off.
void FolderScan::PooledScan::keepAhead()
{
    for (std::size_t item = m_scan.m_done; item < m_items.size(); ++item)
        if (m_states[item].isHeldBack) {
            keep(item);
            m_scan.m_keptAhead.insert(item);
        }
}

/// Writes what there is, also behind an item that takes long; now and then.
void FolderScan::PooledScan::writeInterim()
{
    if (!m_owesWrite || (m_sinceWrite.isValid() && !m_sinceWrite.hasExpired(kWritePause)))
        return;
    m_owesWrite = false;
    settleVerdicts();
    m_scan.m_memory.write(false);
    m_sinceWrite.start();
}

/// Writes what there is. The markers go whose verdicts are on disk then.
void FolderScan::PooledScan::settleVerdicts()
{
    if (!m_scan.writeInterim())
        return;
    const auto isOnDisk = [this](std::size_t item) {
        return !m_states[item].outcome || m_states[item].isHeldBack;
    };
    if (std::any_of(m_verdicts.begin(), m_verdicts.end(), isOnDisk))
        m_scan.m_memory.write(true); // the markers held this as well
    for (const std::size_t item : m_verdicts)
        if (isOnDisk(item)) {
            m_states[item].marker.remove();
            m_scan.m_host.clearSuspect(m_items[item].path);
        }
    m_verdicts.erase(std::remove_if(m_verdicts.begin(), m_verdicts.end(), isOnDisk), m_verdicts.end());
}

void FolderScan::makePool()
{
    m_pooled = std::make_shared<PooledScan>(*this);
    m_pooled->begin();
}

bool FolderScan::probeInPool() { return m_pooled->run(); }
