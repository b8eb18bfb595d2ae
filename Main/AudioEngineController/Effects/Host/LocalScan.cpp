#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Host/FolderScan.h"
#include "Main/AudioEngineController/Effects/Host/ProbeRunner.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanControl.h"
#include "Main/VLib/SimpleGUI.h"
#include "Main/VLib/VProgressDisplay.h"

// A scan whose plug-ins are asked in this process, one after another.

class FolderScan::LocalScan : private IProbeObserver {
public:
    explicit LocalScan(FolderScan &scan)
        : m_scan(scan)
    {}

    /// False when not all were asked: the scan was cancelled.
    bool run();
    void probe(const ScanItem &item);

private:
    void showProgress();

    void stageEntered(ProbeStage stage) override;
    void classBegins(const QString &name) override { showScanning(name); }
    void classAnnounced() override { notifyUI(MessageCode::kEntryAdded); }
    void childrenFound(std::size_t count) override;
    void childBegins(const EffectRecord &child) override;
    void childEnds(const ProbeOutcome &outcome) override;
    void childCloses(const EffectRecord &) override {}
    void childClosed() override {}

    FolderScan &m_scan;
    std::unique_ptr<ProbeRunner> m_runner; ///< made for the first item: most scans find nothing new
    EffectRecord m_child;                  ///< the sub-plug-in at hand
    std::size_t m_childrenDone = 0;        ///< of the item at hand
};

bool FolderScan::LocalScan::run()
{
    showProgress();
    for (const ScanItem &item : m_scan.m_plan->items()) {
        if (m_scan.isCancelled())
            return false;
        probe(item);
        ++m_scan.m_done;
        if (m_scan.m_progress)
            m_scan.m_progress->setValue(static_cast<int>(m_scan.m_done));
    }
    return !m_scan.isCancelled();
}

void FolderScan::LocalScan::showProgress()
{
    if (!m_scan.m_progress)
        return;
    m_scan.m_progress->setRange(static_cast<int>(m_scan.m_plan->items().size()), QString());
    m_scan.m_progress->setValue(static_cast<int>(m_scan.m_done));
}

void FolderScan::LocalScan::probe(const ScanItem &item)
{
    if (!m_runner)
        m_runner = std::make_unique<ProbeRunner>(m_scan.m_host);
    m_scan.beginItem(item);
    m_childrenDone = 0;
    const ProbeOutcome outcome = ScanControl::instance().isSkipped(item.path)
                                     ? ProbeOutcome::skipped()
                                     : readable(item, m_runner->run(m_scan.jobOf(item), *this));
    m_scan.m_memory.end(m_scan.m_file, outcome, m_scan.m_isTouched);
    const bool added = m_scan.keepOutcome(item, outcome);
    m_scan.log(item, outcome, 0);
    if (added)
        m_scan.writeInterim();
    m_scan.m_memory.write(false);
    m_scan.m_host.clearSuspect(item.path);
    if (m_childrenDone != 0)
        showProgress();
}

void FolderScan::LocalScan::stageEntered(ProbeStage stage)
{
    if (!m_scan.m_isTouched) {
        m_scan.m_isTouched = true;
        showScanning(m_scan.m_host.displayName(m_scan.m_file.path));
        DebugTrace(L"Probing %ls", m_scan.m_file.path);
        ProbeReport::instance().begin(m_scan.m_host.format(), m_scan.m_file);
    }
    ProbeReport::instance().stage(stage);
}

void FolderScan::LocalScan::childrenFound(std::size_t count)
{
    if (m_scan.m_progress)
        m_scan.m_progress->setRange(static_cast<int>(count), QStringLiteral("Scanning WaveShell"));
}

void FolderScan::LocalScan::childBegins(const EffectRecord &child)
{
    m_child = child;
    showScanning(child.subName);
    ProbeReport::instance().begin(m_scan.m_host.format(), child);
}

void FolderScan::LocalScan::childEnds(const ProbeOutcome &outcome)
{
    if (!outcome.reason.isEmpty())
        DebugLog(L"%ls, %ls: %ls", m_child.path, m_child.subName, outcome.reason);
    ProbeReport::instance().end(m_scan.m_host.format(), m_child, outcome);
    m_scan.m_memory.childEnded(m_child.subId, outcome.reason);
    ++m_childrenDone;
    if (m_scan.m_progress)
        m_scan.m_progress->setValue(static_cast<int>(m_childrenDone));
}

bool FolderScan::probeHere()
{
    m_local = std::make_shared<LocalScan>(*this);
    return m_local->run();
}

void FolderScan::probe(const ScanItem &item)
{
    if (!m_local)
        m_local = std::make_shared<LocalScan>(*this);
    m_local->probe(item);
}
