#include "Main/AudioEngineController/Effects/Launcher/ScannerLauncher.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Launcher/MarkerWatch.h"
#include "Main/AudioEngineController/Effects/Launcher/ScannerChild.h"
#include "Main/AudioEngineController/Effects/Launcher/ScannerProcess.h"
#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanControl.h"

#include <algorithm>
#include <chrono>

namespace {

constexpr std::chrono::milliseconds kStartPatience(30000);
constexpr std::chrono::milliseconds kStep(1000);
/// How often in a step somebody's requests are looked for.
constexpr int kLooks = 10;

QString blame(const ScannerRunEnd &end, std::optional<ProbeStage> stage)
{
    const QString when = stage ? QLatin1String(duringStage(*stage)) : QLatin1String();
    switch (end.how) {
    case ScannerRunEnd::How::Crashed:
        return QStringLiteral("it crashed the scanner%1 (%2)").arg(when, end.text);
    case ScannerRunEnd::How::TimeLimit:
        return QStringLiteral("it gave no answer for %1 s%2").arg(end.code).arg(when);
    default:
        return QStringLiteral("it ended the scanner with exit code %1%2").arg(end.code).arg(when);
    }
}

/// Names the culprits of a run that has ended, and has the next run and later ones know what they did.
void findCulprits(const QString &effectsFolder, MarkerWatch &watch, ScannerRunEnd &end)
{
    watch.look();
    ProbeMemory memory(effectsFolder);
    const std::vector<FoundMarker> markers = readMarkers(watch.markersOfRun());
    for (const FoundMarker &marker : markers) {
        if (isExcused(marker, markers))
            continue;
        const QString reason = blame(end, watch.lastStage());
        const ProbeStatus status =
            end.how == ScannerRunEnd::How::TimeLimit ? ProbeStatus::NoAnswer : ProbeStatus::Crashed;
        end.culprits.push_back({marker.format, marker.plugin, reason, status});
        memory.setCrash(marker.format, marker.plugin, status, reason);
    }
    if (const FileResult written = memory.write(); !written)
        DebugLog(L"Cannot write what the probes came to: %ls", written.reason);
}

void logOutput(ScannerProcess &scanner)
{
    for (const QString &line : scanner.takeOutput().split(QLatin1Char('\n'), Qt::SkipEmptyParts))
        DebugTrace(L"The scanner printed: %ls", line);
}

} // namespace

QString ScannerRunEnd::description() const
{
    switch (how) {
    case How::NotStarted:
        return QStringLiteral("it could not be started: ") + text;
    case How::Exited:
        return QStringLiteral("it ended by itself with exit code %1").arg(code);
    case How::Crashed:
        return QStringLiteral("it was ended by ") + text;
    case How::TimeLimit:
        return QStringLiteral("it was ended after %1 s without an answer").arg(code);
    case How::Cancelled:
        return QStringLiteral("it was ended because the scan was cancelled");
    case How::Skipped:
        return QStringLiteral("it was ended to pass over the plug-in that it was busy with");
    }
    return QString();
}

void ScannerLauncher::run(const Job &job)
{
    for (int run = 0; run < kMaxRuns && !m_cancelled;) {
        job.writeScanList();
        const std::optional<ScannerRunEnd::How> end = runOnce(job);
        if (!end)
            return;
        run += *end == ScannerRunEnd::How::Skipped ? 0 : 1; // a user may skip as many as there are
    }
}

/// One run; how it ended when another run has to follow.
std::optional<ScannerRunEnd::How> ScannerLauncher::runOnce(const Job &job)
{
    using How = ScannerRunEnd::How;
    const auto report = job.environment.find(QStringLiteral("FXPROBE_REPORT"));
    MarkerWatch watch(job.effectsFolder, report != job.environment.end()
                                             ? report->second
                                             : qEnvironmentVariable("FXPROBE_REPORT"));
    ScannerProcess scanner;
    for (const auto &[variable, value] : job.environment)
        scanner.setEnvironment(variable, value);
    scanner.setEnvironment("FXPROBE_JOBS", std::max(job.jobs, 0)); // whatever this process has
    scanner.setEnvironment("FXPROBE_PROBE_LIMIT", job.probeLimit);
    if (job.jobs > 0)
        scanner.setEnvironment("FXPROBE_MEMORY_LIMIT", job.memoryLimit);
    scanner.setEnvironment(ScanControl::kVariable, 1);
    m_passedOn = 0;
    ScannerRunEnd end;
    if (!scanner.start(job.program, QStringList(job.scanList), kStartPatience)) {
        DebugLog(L"Scanner failed to Start: %d", scanner.errorCode());
        end.code = scanner.errorCode();
        end.text = scanner.errorText();
        add(end); // at once: only a cancel ends what follows
    }
    const bool isStarted = end.text.isEmpty();
    waitForEnd(job, scanner, watch, end);
    if (isStarted) {
        DebugLog(L"The scanner has ended: %ls", end.description());
        add(end);
    }
    if (end.how == How::Cancelled || (end.how != How::Skipped && watch.markers().isEmpty()))
        return std::nullopt;
    return end.how;
}

void ScannerLauncher::waitForEnd(const Job &job, ScannerProcess &scanner, MarkerWatch &watch,
                                 ScannerRunEnd &end)
{
    using How = ScannerRunEnd::How;
    while (!waitStep(scanner)) {
        logOutput(scanner);
        watch.look();
        // A scanner with workers gives a plug-in up by itself.
        const bool endsForSkip = job.jobs <= 0 && isSkipAtHand(watch);
        if (m_cancelled || endsForSkip) {
            const bool isOverdue = !endsForSkip && isOverLimit(job, watch);
            scanner.end();
            end.how = endsForSkip ? How::Skipped : How::Cancelled;
            // Nobody is to blame, unless the plug-in had its time. Markers that the run found are not ours.
            for (const QString &marker : isOverdue ? QStringList() : watch.markersOfRun())
                removeMarkerFile(marker);
            return;
        }
        if (isOverLimit(job, watch)) {
            scanner.kill();
            end.how = How::TimeLimit;
            end.code = job.probeLimit;
            findCulprits(job.effectsFolder, watch, end);
            return;
        }
    }
    logOutput(scanner);
    end.how = scanner.hasCrashed() ? How::Crashed : How::Exited;
    end.code = scanner.exitCode();
    if (scanner.hasCrashed())
        end.text = ScannerChild::crashText(scanner.exitCode());
    findCulprits(job.effectsFolder, watch, end);
}

/// Waits for a step, or until somebody asks for something; true when the scanner has ended.
bool ScannerLauncher::waitStep(ScannerProcess &scanner)
{
    for (int look = 0; look < kLooks && !m_cancelled && !passSkipsOn(scanner); ++look)
        if (scanner.waitForFinished(kStep / kLooks))
            return true;
    return false;
}

/// Tells the scanner what to pass over; true when there is news.
bool ScannerLauncher::passSkipsOn(ScannerProcess &scanner)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    const bool isNews = m_passedOn < m_skips.size();
    for (; m_passedOn < m_skips.size(); ++m_passedOn)
        scanner.write(ScanControl::skipLine(m_skips.at(m_passedOn)));
    return isNews;
}

/// Whether the run is busy with a file that is to be passed over.
bool ScannerLauncher::isSkipAtHand(const MarkerWatch &watch) const
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    if (m_skips.isEmpty())
        return false;
    const std::vector<FoundMarker> markers = readMarkers(watch.markersOfRun());
    return std::any_of(markers.begin(), markers.end(),
                       [this](const FoundMarker &marker) { return m_skips.contains(marker.plugin.path); });
}

void ScannerLauncher::skip(const QString &path)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_skips.append(path);
}

bool ScannerLauncher::isOverLimit(const Job &job, const MarkerWatch &watch) const
{
    // In steps, not by a clock: the time a machine sleeps does not count.
    if (job.probeLimit <= 0)
        return false;
    // A scanner with workers ends those that give no answer by itself, and asks once more.
    constexpr int kPatience = 10; // s
    return job.jobs > 0 ? watch.looksWithoutNews() >= 2 * job.probeLimit + kPatience
                        : watch.looksWithoutChange() >= job.probeLimit;
}

void ScannerLauncher::reset()
{
    m_cancelled = false;
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_ends.clear();
    m_skips.clear();
}

std::vector<ScannerRunEnd> ScannerLauncher::ends() const
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    return m_ends;
}

void ScannerLauncher::add(const ScannerRunEnd &end)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_ends.push_back(end);
}
