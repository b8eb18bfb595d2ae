#include "Workstation/Summary/ScanAccount.h"

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
{}

void ScanAccount::update()
{
    for (const ReportLine &line : m_report.takeNewLines())
        takeLine(line);
}

void ScanAccount::takeLine(const ReportLine &line)
{
    using Event = ReportLine::Event;
    m_finished = line.event == Event::Finished;
    m_busy = line.event == Event::Busy;
    switch (line.event) {
    case Event::Start:
        m_done += static_cast<int>(std::count_if(m_open.begin(), m_open.end(),
                                                 [](const Open &open) { return open.key.subId == 0; }));
        m_open.clear();
        m_planned = m_done; // what is left of the plan is planned anew
        break;
    case Event::Plan:
        m_planned += line.probes;
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
        addProblem(QStringLiteral("the scan list %1 cannot be used, so nothing was scanned: %2")
                       .arg(line.path, line.reason));
        break;
    case Event::Stage:
        if (const PluginKey *key = innermost(line.worker))
            m_probes[*key].isLoaded = true;
        break;
    case Event::Busy:
    case Event::Finished:
    case Event::WorkerEnd: // what it was busy with is begun again, or has ended
        m_open.erase(std::remove_if(m_open.begin(), m_open.end(),
                                    [&](const Open &open) { return open.worker == line.worker; }),
                     m_open.end());
        break;
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
    m_open.push_back({line.worker, keyOf(line)});
    m_begun.push_back(keyOf(line));
    ProbeAccount account;
    account.subName = line.subName;
    m_probes[keyOf(line)] = account;
}

void ScanAccount::end(const ReportLine &line)
{
    const bool isSkipped = line.event == ReportLine::Event::Skipped;
    ProbeAccount &account = m_probes[keyOf(line)];
    account.noPlugin = isSkipped || line.noPlugin;
    account.isSkipped = line.isSkipped;
    account.reason = line.reason;
    account.records = line.records;
    account.milliseconds = line.milliseconds;
    // With a shell go its sub-plug-ins, also one that ended the worker.
    const auto isOver = [&](const Open &open) {
        return open.worker == line.worker && (line.subId == 0 || open.key == keyOf(line));
    };
    m_open.erase(std::remove_if(m_open.begin(), m_open.end(), isOver), m_open.end());
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
    }
}

const PluginKey *ScanAccount::innermost(int worker) const
{
    const auto found = std::find_if(m_open.rbegin(), m_open.rend(),
                                    [worker](const Open &open) { return open.worker == worker; });
    return found == m_open.rend() ? nullptr : &found->key;
}

std::vector<PluginKey> ScanAccount::takeBegun()
{
    std::vector<PluginKey> begun;
    begun.swap(m_begun);
    return begun;
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
