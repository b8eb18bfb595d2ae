#include "Workstation/Summary/ScanTimeline.h"

#include <algorithm>

namespace {

/// Gives each worker a row; rows[worker].
std::map<int, std::size_t> rowsOf(const std::vector<TimelineBar> &bars)
{
    std::map<int, double> lastEnds; // of workers
    for (const TimelineBar &bar : bars)
        lastEnds[bar.worker] = std::max(lastEnds[bar.worker], bar.end);
    std::map<int, std::size_t> rows;
    std::vector<double> freeFrom; // of rows
    for (const TimelineBar &bar : bars) {
        if (rows.count(bar.worker) != 0)
            continue;
        const auto row =
            std::find_if(freeFrom.begin(), freeFrom.end(), [&bar](double time) { return time <= bar.begin; });
        rows[bar.worker] = static_cast<std::size_t>(row - freeFrom.begin());
        if (row == freeFrom.end())
            freeFrom.push_back(lastEnds[bar.worker]);
        else
            *row = lastEnds[bar.worker];
    }
    return rows;
}

} // namespace

ScanTimeline timelineOf(const ScanAccount &account)
{
    ScanTimeline timeline;
    timeline.milliseconds = account.lastTime();
    const std::vector<ProbeSpan> &spans = account.spans();
    for (std::size_t index = 0; index < spans.size(); ++index) {
        const ProbeSpan &span = spans[index];
        const ProbeAccount *probe = account.find(span.key);
        if (!span.isLoaded || !probe)
            continue; // only looked at
        const bool isLast = probe->span == index;
        TimelineBar bar;
        bar.path = span.key.path;
        bar.name = probe->subName.isEmpty() ? fileNameOf(span.key.path) : probe->subName;
        bar.reason = isLast ? probe->reason : QString();
        bar.begin = span.begin;
        bar.end = span.end < 0 ? timeline.milliseconds : span.end;
        bar.worker = span.worker;
        bar.isPart = span.key.subId != 0;
        bar.status = span.status || !isLast ? span.status : ProbeStatus::Cancelled;
        timeline.bars.push_back(bar);
    }
    const std::map<int, std::size_t> rows = rowsOf(timeline.bars);
    for (TimelineBar &bar : timeline.bars) {
        bar.row = rows.at(bar.worker);
        timeline.rows = std::max(timeline.rows, bar.row + 1);
    }
    return timeline;
}
