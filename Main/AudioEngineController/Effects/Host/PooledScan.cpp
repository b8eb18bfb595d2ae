#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Host/FolderScan.h"
#include "Main/AudioEngineController/Effects/Host/OutcomeRecords.h"
#include "Main/AudioEngineController/Effects/Host/ProbePool.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanControl.h"
#include "Main/VLib/SimpleGUI.h"
#include "Main/VLib/VProgressDisplay.h"

#include <QElapsedTimer>

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
    {}

    /// False when the scan was cancelled.
    bool run();

    std::optional<ProbeOutcome> look(std::size_t index) override
    {
        const ScanItem &item = m_items[m_first + index];
        if (ScanControl::instance().isSkipped(item.path))
            return ProbeOutcome::skipped();
        return m_probe->look(m_scan.jobOf(item));
    }
    void jobBegins(std::size_t index, int worker) override;
    void stageEntered(std::size_t index, int worker, ProbeStage stage) override;
    void classBegins(std::size_t index, int worker, const QString &name) override;
    void classAnnounced() override { notifyUI(MessageCode::kEntryAdded); }
    void childBegins(std::size_t index, int worker, const EffectRecord &child) override;
    void childEnds(std::size_t index, int worker, const ProbeOutcome &outcome) override;
    void jobEnds(std::size_t index, int worker, const ProbeOutcome &outcome) override;
    void turn() override
    {
        if (m_owesWrite)
            writeInterim(false);
    }
    void workerEnds(int worker, const QString &reason) override
    {
        ProbeReport::instance().workerEnded(worker, reason);
    }
    bool isCancelled() override { return m_scan.isCancelled(); }
    bool isSkipped(std::size_t index) override
    {
        return ScanControl::instance().isSkipped(m_items[m_first + index].path);
    }

private:
    /// An item, as far as it came.
    struct State {
        CrashMarker marker;
        bool isTouched = false;
        QString shown; ///< what of it a user reads now
        EffectRecord child;
        std::map<quint32, QString> childReasons;
        std::optional<ProbeOutcome> outcome; ///< that is not kept yet
        std::vector<EffectRecord> pending;   ///< its records, among those that wait
    };

    bool ask(std::size_t from, std::size_t to);
    EffectRecord fileOf(std::size_t item) const;
    void show(std::size_t item, const QString &text);
    void showLongest();
    void holdBack(std::size_t item);
    void keepInOrder();
    void probeRest();
    bool writeInterim(bool isUrgent);

    FolderScan &m_scan;
    const std::vector<ScanItem> &m_items;
    std::vector<State> m_states;
    const std::unique_ptr<IPluginProbe> m_probe; ///< looks at files; workers ask plug-ins
    std::size_t m_first = 0;                     ///< item that the pool knows as its job 0
    std::size_t m_ended = 0;
    bool m_isAlone = true;           ///< one job at a time
    std::vector<std::size_t> m_busy; ///< items, the longest at work first
    QElapsedTimer m_sinceWrite;
    bool m_owesWrite = false; ///< something came since
};

bool FolderScan::PooledScan::run()
{
    // Those that were at work when a scanner ended come first, one after the other: what ends a scanner that
    // asks nobody else is the culprit.
    std::size_t suspects = 0;
    while (suspects < m_items.size() && m_scan.m_host.isSuspect(m_items[suspects].path))
        ++suspects;
    bool isWhole = true;
    for (std::size_t item = 0; item < suspects && isWhole; ++item)
        isWhole = ask(item, item + 1);
    m_isAlone = false;
    if (isWhole && ask(suspects, m_items.size()))
        return !m_scan.isCancelled();
    probeRest();
    return !m_scan.isCancelled();
}

/// False when there can be no workers.
bool FolderScan::PooledScan::ask(std::size_t from, std::size_t to)
{
    m_first = from;
    std::vector<ProbeJob> jobs;
    for (std::size_t item = from; item < to; ++item)
        jobs.push_back(m_scan.jobOf(m_items[item]));
    return m_scan.m_host.probePool()->run(std::move(jobs), *this);
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
    if (!m_busy.empty() && m_busy.front() == item)
        showScanning(text);
}

void FolderScan::PooledScan::showLongest()
{
    if (!m_busy.empty() && !m_states[m_busy.front()].shown.isEmpty())
        showScanning(m_states[m_busy.front()].shown);
}

void FolderScan::PooledScan::jobBegins(std::size_t index, int)
{
    const std::size_t item = m_first + index;
    State &state = m_states[item];
    if (!m_scan.m_hasCollected) // most scans find nothing to ask
        m_scan.collectWaiting(m_scan.m_done);
    if (state.marker.path().isEmpty())
        state.marker = m_isAlone ? m_scan.m_host.WriteCrashMarker(fileOf(item))
                                 : m_scan.m_host.writeSuspectMarker(fileOf(item));
    m_busy.push_back(item);
}

void FolderScan::PooledScan::stageEntered(std::size_t index, int worker, ProbeStage stage)
{
    const std::size_t item = m_first + index;
    if (stage == ProbeStage::Load || !m_states[item].isTouched) {
        m_states[item].isTouched = true;
        DebugTrace(L"Probing %ls", m_items[item].path);
        show(item, m_scan.m_host.displayName(m_items[item].path));
        ProbeReport::instance().begin(m_scan.m_host.format(), fileOf(item), worker);
    }
    ProbeReport::instance().stage(stage, worker);
}

void FolderScan::PooledScan::classBegins(std::size_t index, int, const QString &name)
{
    const std::size_t item = m_first + index;
    m_states[item].marker.refresh();
    show(item, name);
}

void FolderScan::PooledScan::childBegins(std::size_t index, int worker, const EffectRecord &child)
{
    const std::size_t item = m_first + index;
    m_states[item].marker.refresh();
    m_states[item].child = child;
    show(item, child.subName);
    ProbeReport::instance().begin(m_scan.m_host.format(), child, worker);
}

void FolderScan::PooledScan::childEnds(std::size_t index, int worker, const ProbeOutcome &outcome)
{
    State &state = m_states[m_first + index];
    const EffectRecord child = outcome.records.empty() ? state.child : outcome.records.front();
    if (!outcome.reason.isEmpty())
        DebugLog(L"%ls, %ls: %ls", child.path, child.subName, outcome.reason);
    // One that ends its worker while it is being closed has ended before.
    if (state.childReasons.count(child.subId) == 0 || !outcome.reason.isEmpty())
        ProbeReport::instance().end(m_scan.m_host.format(), child, outcome, worker);
    state.childReasons[child.subId] = outcome.reason;
}

void FolderScan::PooledScan::jobEnds(std::size_t index, int worker, const ProbeOutcome &outcome)
{
    const std::size_t item = m_first + index;
    State &state = m_states[item];
    m_busy.erase(std::remove(m_busy.begin(), m_busy.end(), item), m_busy.end());
    if (outcome.status == ProbeStatus::Cancelled) { // nobody is to blame
        state.marker.remove();
        return;
    }
    m_scan.beginItem(m_items[item]);
    m_scan.m_isTouched = state.isTouched;
    state.outcome = readable(m_items[item], outcome);
    m_scan.log(m_items[item], *state.outcome, worker);
    ++m_ended;
    if (item == m_scan.m_done)
        keepInOrder();
    else
        holdBack(item);
    if (m_scan.m_progress)
        m_scan.m_progress->setValue(static_cast<int>(m_ended));
    showLongest();
    const bool isVerdict = outcome.status == ProbeStatus::Crashed || outcome.status == ProbeStatus::NoAnswer;
    const bool isKept =
        (!state.isTouched && !isVerdict) // what was only looked at can wait for the last write
        || writeInterim(isVerdict);
    if (isVerdict && !isKept)
        state.marker.leave(); // nothing else holds it
    else
        state.marker.remove();
    m_scan.m_host.clearSuspect(m_items[item].path);
}

/// Has interim writes carry what came of an item before those ahead of it have ended.
void FolderScan::PooledScan::holdBack(std::size_t item)
{
    State &state = m_states[item];
    removeWaiting(m_items[item], m_scan.m_waiting);
    OutcomeRecords records = recordsOfOutcome(m_scan.m_host, *m_scan.m_plan, m_items[item], *state.outcome);
    state.pending = std::move(records.listed);
    state.pending.insert(state.pending.end(), records.kept.begin(), records.kept.end());
    for (const EffectRecord &record : state.pending)
        m_scan.insertFirst(record);
}

/// Keeps the outcomes up to the first item that has none yet.
void FolderScan::PooledScan::keepInOrder()
{
    for (; m_scan.m_done < m_items.size() && m_states[m_scan.m_done].outcome; ++m_scan.m_done) {
        State &state = m_states[m_scan.m_done];
        const ScanItem &item = m_items[m_scan.m_done];
        for (const EffectRecord &record : state.pending)
            takeOut(record, m_scan.m_waiting);
        m_scan.beginItem(item);
        m_scan.m_isTouched = state.isTouched;
        for (const auto &[subId, reason] : state.childReasons)
            m_scan.m_memory.childEnded(subId, reason);
        m_scan.m_memory.end(m_scan.m_file, *state.outcome, m_scan.m_isTouched);
        m_scan.keepOutcome(item, *state.outcome);
        state.outcome.reset();
        state.pending.clear();
    }
}

/// Writes what there is, also behind an item that takes long; now and then, and before a marker goes that
/// names a culprit.
bool FolderScan::PooledScan::writeInterim(bool isUrgent)
{
    m_owesWrite = !isUrgent && m_sinceWrite.isValid() && !m_sinceWrite.hasExpired(kWritePause);
    if (m_owesWrite)
        return true;
    const bool isWritten = m_scan.writeInterim();
    m_scan.m_memory.write(isUrgent);
    m_sinceWrite.start();
    return isWritten;
}

bool FolderScan::probeInPool() { return PooledScan(*this).run(); }
