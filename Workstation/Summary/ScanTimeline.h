#pragma once

#include "Workstation/Summary/ScanAccount.h"

#include <QString>

#include <vector>

/// One attempt at a file or a sub-plug-in, as a bar in a picture of the scan.
struct TimelineBar {
    QString path; ///< of the file
    QString name; ///< of the file or the sub-plug-in
    QString reason;
    double begin = 0; ///< ms since the scan began
    double end = 0;   ///< the same
    std::size_t row = 0;
    int worker = 0;                    ///< 0: the scanner itself
    bool isPart = false;               ///< a sub-plug-in: its bar lies within that of its shell
    std::optional<ProbeStatus> status; ///< nothing: it was asked again
};

/// When a scan asked what. Each row is a worker at a time: a worker takes the row of one that has ended.
struct ScanTimeline {
    std::vector<TimelineBar> bars; ///< in the order in which they begin
    std::size_t rows = 0;
    double milliseconds = 0; ///< that the whole scan took
};

ScanTimeline timelineOf(const ScanAccount &account);
