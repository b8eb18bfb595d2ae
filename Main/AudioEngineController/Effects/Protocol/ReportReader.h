#pragma once

#include "Main/AudioEngineController/Effects/Protocol/Probe.h"

#include <QByteArray>
#include <QString>

#include <vector>

/// One line of a scanner's report, as `ProbeReport` writes it. What an event does not carry is empty or 0.
struct ReportLine {
    enum class Event {
        Start,
        Busy,
        Plan,
        Begin,
        Stage,
        End,
        Skipped,
        Unwritten,
        UnreadList,
        Finished,
        Ended,
        WorkerEnd,
        Looking,
        Unsearched,
        Unknown, ///< of a later version, or damaged
    };

    Event event = Event::Unknown;
    PluginFormat format = PluginFormat::Unknown;
    QString path;
    quint32 subId = 0;
    QString subName;
    ProbeStage stage = ProbeStage::Load;
    ProbeStatus status = ProbeStatus::Failed; ///< of a probe that has ended, or of a file that was skipped
    QString reason;
    double milliseconds = -1;
    double time = -1; ///< when the line was written, in ms since 1970 (UTC); -1: unknown
    int records = 0;
    int files = 0;  ///< found
    int probes = 0; ///< planned
    int worker = 0; ///< that it is about; 0: the scanner itself

    /// The last line of a scan that came to its end, cancelled or not.
    bool isLast() const { return event == Event::Finished || event == Event::Ended; }
};

/// Follows a report while scanners append to it.
class ReportReader {
public:
    /// Begins at the file's present end: what others reported before is not part of this scan.
    explicit ReportReader(const QString &file);

    /// The whole lines that were written since the last call.
    std::vector<ReportLine> takeNewLines();

private:
    QString m_file;
    qint64 m_read;     ///< bytes of the file
    QByteArray m_rest; ///< of a line that is not complete yet
};
