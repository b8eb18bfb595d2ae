#include "Workstation/ScanSession.h"

#include "Core/BaseLib/TerminationRequest.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Main/AudioEngineController/Effects/ProbeReport.h"

#include <QFile>

#include <atomic>
#include <thread>

namespace {
constexpr std::chrono::milliseconds kLook(50);
}

ScanSession::ScanSession(const ScanOptions &options, PluginHost &registry, const QString &report)
    : m_options(options)
    , m_registry(registry)
    , m_account(report)
    , m_progress(options.quiet)
{
    TerminationSignal::install();
    registry.setProbeLimit(options.timeout);
}

bool ScanSession::run()
{
    // A launch is over after so many runs; where each of them found another culprit, the next launch goes on.
    while (!scanOnce())
        if (m_cancelled || isStuck())
            return false;
    return true;
}

/// True when the scan came to its end.
bool ScanSession::scanOnce()
{
    m_ends = 0;
    m_culprits = 0;
    m_reason.clear();
    if (m_options.inProcess) {
        scanHere();
    } else {
        m_registry.Scan(true, false);
        waitForLauncher();
    }
    m_account.update();
    if (m_account.isFinished() && !m_cancelled)
        return true;
    if (m_cancelled)
        m_reason = QStringLiteral("the scan was cancelled; what was found until then is kept");
    else if (m_account.isBusy())
        m_reason = QStringLiteral("another scanner is at work on the same folder");
    else if (m_reason.isEmpty())
        m_reason = QStringLiteral("the scanner did not write its last catalogue");
    return false;
}

bool ScanSession::isStuck() const { return m_culprits < static_cast<std::size_t>(ScannerLauncher::kMaxRuns); }

void ScanSession::scanHere()
{
    std::atomic<bool> isDone{false};
    std::thread worker([&] {
        m_registry.Scan(true, true);
        ProbeReport::instance().finish();
        isDone = true;
    });
    while (!isDone)
        watchForCancel();
    worker.join();
}

void ScanSession::waitForLauncher()
{
    while (m_registry.isLauncherRunning()) {
        watchForCancel();
        takeEnds();
    }
    takeEnds();
}

/// Waits a moment, looks at the report, and passes on what asks us to end.
void ScanSession::watchForCancel()
{
    if (TerminationSignal::wait(kLook)) {
        if (!m_cancelled)
            m_progress.say(QStringLiteral("Cancelling"));
        m_cancelled = true;
        m_registry.cancelScan();
    }
    m_account.update();
    m_progress.show(m_account);
}

void ScanSession::takeEnds()
{
    const std::vector<ScannerRunEnd> ends = m_registry.scannerEnds();
    for (; m_ends < ends.size(); ++m_ends) {
        const ScannerRunEnd &end = ends[m_ends];
        m_account.scannerEnded(end);
        m_culprits += end.culprits.empty() ? 0 : 1;
        for (const ScanCulprit &culprit : end.culprits)
            m_progress.say(QStringLiteral("%1: %2").arg(culprit.plugin.path, m_account.reasonOf(culprit)));
        if (end.how == ScannerRunEnd::How::NotStarted) {
            m_registry.cancelScan(); // nothing else would end the launcher
            m_reason = QStringLiteral("the scanner %1 could not be started: %2")
                           .arg(m_registry.scannerPath(), end.text);
        } else if (end.culprits.empty() && (end.how != ScannerRunEnd::How::Exited || end.code != 0)) {
            m_reason = QStringLiteral("the scanner did not finish: ") + end.description();
        }
    }
}
