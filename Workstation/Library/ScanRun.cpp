#include "Workstation/Library/ScanRun.h"

#include "Main/AudioEngineController/Effects/PluginHost.h"

ScanRun::ScanRun(PluginHost &registry, const QString &report)
    : m_registry(registry)
    , m_account(report)
{}

bool ScanRun::run()
{
    // A launch is over after so many runs. Where it got on, the next one goes on; a plug-in that ends the
    // scanner although it was blamed before would do so for ever.
    while (!isDoneAfterOnce())
        if (m_cancelled || !m_hasNewCulprit)
            return false;
    return true;
}

/// Scans once; true when that came to its end.
bool ScanRun::isDoneAfterOnce()
{
    m_ends = 0;
    m_hasNewCulprit = false;
    m_reason.clear();
    scanOnce();
    m_account.update();
    show(m_account);
    if (m_account.isFinished() && !m_cancelled)
        return true;
    const bool wasCancelled = m_account.hasGivenUp() && m_account.problems().isEmpty();
    if ((m_cancelled || wasCancelled) && m_reason.isEmpty())
        m_reason = QStringLiteral("the scan was cancelled; what was found until then is kept");
    else if (m_account.isBusy())
        m_reason = QStringLiteral("another scanner is at work on the same folder");
    else if (m_reason.isEmpty())
        m_reason = m_account.problems().value(
            0, QStringLiteral("the scanner did not write its last catalogue; see its log"));
    return false;
}

void ScanRun::scanOnce()
{
    m_registry.Scan(true, false);
    while (m_registry.isLauncherRunning()) {
        look();
        takeEnds();
    }
    takeEnds();
}

void ScanRun::look()
{
    wait();
    m_account.update();
    show(m_account);
}

void ScanRun::cancel()
{
    m_cancelled = true;
    m_registry.cancelScan();
}

void ScanRun::takeEnds()
{
    const std::vector<ScannerRunEnd> ends = m_registry.scannerEnds();
    for (; m_ends < ends.size(); ++m_ends)
        takeEnd(ends[m_ends]);
}

void ScanRun::takeEnd(const ScannerRunEnd &end)
{
    m_account.scannerEnded(end);
    for (const ScanCulprit &culprit : end.culprits) {
        m_hasNewCulprit |= m_blamed.insert(pluginKey(culprit)).second;
        culpritFound(culprit);
    }
    if (end.how == ScannerRunEnd::How::NotStarted) {
        m_reason =
            QStringLiteral("the scanner %1 could not be started: %2").arg(m_registry.scannerPath(), end.text);
        cancel(); // nothing else would end the launcher
    } else if (end.how != ScannerRunEnd::How::Skipped && end.how != ScannerRunEnd::How::Cancelled &&
               end.culprits.empty() && (end.how != ScannerRunEnd::How::Exited || end.code != 0)) {
        m_reason = QStringLiteral("the scanner did not finish: ") + end.description();
    }
}
