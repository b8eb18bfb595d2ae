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

} // namespace

ScanSession::ScanSession(const ScanOptions &options, PluginHost &registry, const QString &report,
                         JsonLines &lines)
    : ScanRun(registry, report)
    , m_options(options)
    , m_progress(options.quiet, options.inProcess ? 0 : options.timeout)
    , m_lines(lines)
{
    if (!options.inProcess)
        m_keys.emplace();
    TerminationSignal::install();
    registry.setProbeLimit(options.timeout);
    registry.setScanJobs(options.jobs);
    registry.setMemoryLimit(options.memoryLimit);
}

bool ScanSession::run()
{
    const auto endLine = qScopeGuard([this] { m_progress.end(); });
    return ScanRun::run();
}

void ScanSession::scanOnce()
{
    if (!m_options.inProcess) {
        ScanRun::scanOnce();
        return;
    }
    Terminal::keepOutputForResult();
    s_isScanningHere = true;
    std::atexit(leaveUnfinished);
    std::atomic<bool> isDone{false};
    std::thread worker([&] {
        registry().Scan(true, true);
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
void ScanSession::endOverdueProbe()
{
    if (!isCancelled() || !m_sinceCancel.hasExpired(kPatience))
        return;
    m_progress.end();
    Terminal::complain(QStringLiteral("the scan was cancelled, and a plug-in did not return"));
    CrashMarker::abandonAll([] { leaveProcess(ScanExit::kNotFinished); });
}

/// Waits a moment, and passes on what asks us to end.
void ScanSession::wait()
{
    if (TerminationSignal::wait(kLook))
        cancelForUser();
    takeKeys();
}

void ScanSession::show(ScanAccount &account)
{
    m_progress.show(account, m_keys && m_keys->areThere());
    m_lines.show(account);
    if (m_lines.isBroken() && !isCancelled())
        cancelForUser();
}

void ScanSession::takeKeys()
{
    switch (m_keys ? m_keys->take() : '\0') {
    case 's':
        skip();
        break;
    case 'q':
        cancelForUser();
        break;
    default:
        break;
    }
}

/// Gives up on the plug-in that has been at work for the longest.
void ScanSession::skip()
{
    const PluginKey *plugin = account().current();
    if (!plugin)
        return;
    m_progress.say(QStringLiteral("Skipping %1").arg(plugin->path));
    registry().skipProbe(plugin->path);
}

void ScanSession::cancelForUser()
{
    m_progress.say(QStringLiteral("Cancelling"));
    if (!isCancelled())
        m_sinceCancel.start();
    cancel();
}

void ScanSession::culpritFound(const ScanCulprit &culprit)
{
    m_progress.say(QStringLiteral("%1: %2").arg(culprit.plugin.path, culprit.reason));
}
