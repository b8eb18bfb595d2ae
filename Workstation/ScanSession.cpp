#include "Workstation/ScanSession.h"

#include "Core/BaseLib/Process/ProcessSetup.h"
#include "Core/BaseLib/Process/TerminationRequest.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Workstation/Output/Terminal.h"

#include <QScopeGuard>

#include <atomic>
#include <cstdlib>
#include <thread>

namespace {

constexpr std::chrono::milliseconds kLook(50);
constexpr qint64 kPatience = 2000; ///< ms that a plug-in in this process gets after a cancel

std::atomic<bool> s_isScanningHere{false};

/// A plug-in in this process may call exit(): that is not a successful scan.
void leaveUnfinished()
{
    if (s_isScanningHere)
        leaveProcess(ScanExit::kNotFinished);
}

/// What the live line says of them.
QString keysInWords(const ScanOptions &options, const TerminalKeys &keys)
{
    if (!keys.areThere())
        return QString();
    return options.inProcess ? QStringLiteral("; q cancels") : QStringLiteral("; s skips it, q cancels");
}

} // namespace

ScanSession::ScanSession(const ScanOptions &options, PluginHost &registry, const QString &report)
    : m_options(options)
    , m_registry(registry)
    , m_account(report)
    , m_progress(options.quiet, options.inProcess ? 0 : options.timeout, keysInWords(options, m_keys))
{
    TerminationSignal::install();
    registry.setProbeLimit(options.timeout);
    registry.setScanJobs(options.jobs);
    registry.setMemoryLimit(options.memoryLimit);
}

bool ScanSession::run()
{
    const auto endLine = qScopeGuard([this] { m_progress.end(); });
    // A launch is over after so many runs. Where it got on, the next one goes on; a plug-in that ends the
    // scanner although it was blamed before would do so for ever.
    while (!scanOnce())
        if (m_cancelled || !m_hasNewCulprit)
            return false;
    return true;
}

/// True when the scan came to its end.
bool ScanSession::scanOnce()
{
    m_ends = 0;
    m_hasNewCulprit = false;
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
    if (m_cancelled && m_reason.isEmpty())
        m_reason = QStringLiteral("the scan was cancelled; what was found until then is kept");
    else if (m_account.isBusy())
        m_reason = QStringLiteral("another scanner is at work on the same folder");
    else if (m_reason.isEmpty())
        m_reason = m_account.problems().value(
            0, QStringLiteral("the scanner did not write its last catalogue; see its log"));
    return false;
}

void ScanSession::scanHere()
{
    Terminal::keepOutputForResult();
    s_isScanningHere = true;
    std::atexit(leaveUnfinished);
    std::atomic<bool> isDone{false};
    std::thread worker([&] {
        m_registry.Scan(true, true);
        ProbeReport::instance().finish();
        isDone = true;
    });
    while (!isDone) {
        look();
        endOverdueProbe();
    }
    worker.join();
    s_isScanningHere = false;
}

/// Nobody else can end a plug-in that does not return.
void ScanSession::endOverdueProbe() const
{
    if (m_cancelled && m_sinceCancel.hasExpired(kPatience))
        CrashMarker::abandonAll([] { leaveProcess(ScanExit::kNotFinished); });
}

void ScanSession::waitForLauncher()
{
    while (m_registry.isLauncherRunning()) {
        look();
        takeEnds();
    }
    takeEnds();
}

/// Waits a moment, looks at the report, and passes on what asks us to end.
void ScanSession::look()
{
    if (TerminationSignal::wait(kLook)) {
        m_progress.say(QStringLiteral("Cancelling"));
        cancel();
    }
    takeKeys();
    m_account.update();
    m_progress.show(m_account);
}

void ScanSession::takeKeys()
{
    switch (m_keys.take()) {
    case 's':
        skip();
        break;
    case 'q':
        m_progress.say(QStringLiteral("Cancelling"));
        cancel();
        break;
    default:
        break;
    }
}

/// Gives up on the plug-in that has been at work for the longest.
void ScanSession::skip()
{
    const PluginKey *plugin = m_account.current();
    if (!plugin)
        return;
    if (m_options.inProcess) {
        m_progress.say(QStringLiteral("A plug-in in this process cannot be skipped"));
        return;
    }
    m_progress.say(QStringLiteral("Skipping %1").arg(plugin->path));
    m_registry.skipProbe(plugin->path);
}

void ScanSession::cancel()
{
    if (!m_cancelled)
        m_sinceCancel.start();
    m_cancelled = true;
    m_registry.cancelScan();
}

void ScanSession::takeEnds()
{
    const std::vector<ScannerRunEnd> ends = m_registry.scannerEnds();
    for (; m_ends < ends.size(); ++m_ends)
        takeEnd(ends[m_ends]);
}

void ScanSession::takeEnd(const ScannerRunEnd &end)
{
    m_account.scannerEnded(end);
    for (const ScanCulprit &culprit : end.culprits) {
        m_hasNewCulprit |= m_blamed.insert(pluginKey(culprit)).second;
        m_progress.say(QStringLiteral("%1: %2").arg(culprit.plugin.path, culprit.reason));
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
