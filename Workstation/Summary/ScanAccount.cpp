#include "Workstation/Summary/ScanAccount.h"

#include <QDateTime>

#include <algorithm>

namespace {

PluginKey keyOf(const ReportLine &line) { return {line.format, line.path, line.subId}; }

} // namespace

PluginKey pluginKey(const ScanCulprit &culprit)
{
    return {culprit.format, culprit.plugin.path, culprit.plugin.subId};
}

ScanAccount::ScanAccount(const QString &reportFile)
    : m_report(reportFile)
    , m_began(static_cast<double>(QDateTime::currentMSecsSinceEpoch()))
{}

double ScanAccount::now() const { return static_cast<double>(QDateTime::currentMSecsSinceEpoch()) - m_began; }

void ScanAccount::update()
{
    for (const ReportLine &line : m_report.takeNewLines())
        takeLine(line);
}

void ScanAccount::takeLine(const ReportLine &line)
{
    using Event = ReportLine::Event;
    // A clock that was set back meanwhile must not turn anything round.
    m_lastTime = std::max(m_lastTime, line.time - m_began);
    m_finished = line.event == Event::Finished;
    m_givenUp = line.event == Event::Ended;
    m_busy = line.event == Event::Busy;
    m_looking = line.event == Event::Looking ? line.path : QString();
    switch (line.event) {
    case Event::Unsearched:
        addProblem(QStringLiteral("%1 could not be searched: %2").arg(line.path, line.reason));
        break;
    case Event::Start:
        m_done += static_cast<int>(std::count_if(m_open.begin(), m_open.end(),
                                                 [](const Open &open) { return open.key.subId == 0; }));
        closeOpen([](const Open &) { return true; }, std::nullopt);
        m_planned = m_done; // what is left of the plan is planned anew
        break;
    case Event::Plan:
        m_planned += line.probes;
        m_news.push_back(PlannedFormat{line.format, line.files, line.probes});
        break;
    case Event::Begin:
        begin(line);
        break;
    case Event::End:
    case Event::Skipped:
        end(line);
        break;
    case Event::Unwritten:
        addProblem(QStringLiteral("%1 could not be written: %2").arg(line.path, line.reason));
        break;
    case Event::UnreadList:
        addProblem(
            QStringLiteral("%1 cannot be used, so nothing was scanned: %2").arg(line.path, line.reason));
        break;
    case Event::Stage:
        if (const Open *open = innermost(line.worker)) {
            m_probes[open->key].isLoaded = true;
            m_spans[open->span].isLoaded = true;
        }
        break;
    case Event::Busy:
    case Event::Finished:
    case Event::WorkerEnd: // what it was busy with is begun again, or has ended
        closeOpen([&](const Open &open) { return open.worker == line.worker; }, std::nullopt);
        break;
    case Event::Looking:
    case Event::Ended:
    case Event::Unknown:
        break;
    }
}

void ScanAccount::addProblem(const QString &problem)
{
    if (!m_problems.contains(problem))
        m_problems.append(problem);
}

void ScanAccount::begin(const ReportLine &line)
{
    m_open.push_back({line.worker, keyOf(line), m_spans.size()});
    m_begun.push_back({keyOf(line), m_done, m_planned});
    ProbeSpan span;
    span.key = keyOf(line);
    span.worker = line.worker;
    span.begin = m_lastTime;
    m_spans.push_back(span);
    ProbeAccount account;
    account.subName = line.subName;
    account.worker = line.worker;
    account.span = m_spans.size() - 1;
    m_probes[keyOf(line)] = account;
}

/// Ends what of the probes under way is over.
void ScanAccount::closeOpen(const std::function<bool(const Open &)> &isOver,
                            std::optional<ProbeStatus> status)
{
    const auto first =
        std::stable_partition(m_open.begin(), m_open.end(), [&](const Open &open) { return !isOver(open); });
    for (auto open = first; open != m_open.end(); ++open) {
        m_spans[open->span].end = m_lastTime;
        m_spans[open->span].status = status;
    }
    m_open.erase(first, m_open.end());
}

/// What the last attempt at a plug-in came to; it may be known only after it has ended.
void ScanAccount::setStatus(const PluginKey &key, ProbeStatus status)
{
    ProbeAccount &account = m_probes[key];
    account.status = status;
    if (account.span)
        m_spans[*account.span].status = status;
    m_news.push_back(key);
}

void ScanAccount::end(const ReportLine &line)
{
    ProbeAccount &account = m_probes[keyOf(line)];
    account.reason = line.reason;
    account.records = line.records;
    account.milliseconds = line.milliseconds;
    // With a shell go its sub-plug-ins, also one that ended the worker.
    const auto isOver = [&](const Open &open) {
        return open.worker == line.worker && (line.subId == 0 || open.key == keyOf(line));
    };
    closeOpen(isOver, line.status);
    setStatus(keyOf(line), line.status);
    if (line.subId == 0)
        ++m_done;
}

void ScanAccount::scannerEnded(const ScannerRunEnd &end)
{
    update();
    for (const ScanCulprit &culprit : end.culprits) {
        ProbeAccount &account = m_probes[pluginKey(culprit)];
        account.reason = culprit.reason;
        account.records = 0;
        setStatus(pluginKey(culprit), culprit.status);
    }
}

const ScanAccount::Open *ScanAccount::innermost(int worker) const
{
    const auto found = std::find_if(m_open.rbegin(), m_open.rend(),
                                    [worker](const Open &open) { return open.worker == worker; });
    return found == m_open.rend() ? nullptr : &*found;
}

std::vector<BegunProbe> ScanAccount::takeBegun()
{
    std::vector<BegunProbe> begun;
    begun.swap(m_begun);
    return begun;
}

std::vector<ScanNews> ScanAccount::takeNews()
{
    std::vector<ScanNews> news;
    news.swap(m_news);
    return news;
}

const ProbeAccount *ScanAccount::find(const PluginKey &key) const
{
    const auto found = m_probes.find(key);
    return found == m_probes.end() ? nullptr : &found->second;
}

bool ScanAccount::wasProbed(PluginFormat format, const QString &path) const
{
    const auto found = m_probes.lower_bound({format, path, 0});
    return found != m_probes.end() && found->first.format == format && found->first.path == path &&
           found->second.isLoaded;
}
