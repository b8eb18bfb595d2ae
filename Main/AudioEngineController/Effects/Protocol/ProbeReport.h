#pragma once

#include "Core/BaseLib/Files/TextFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/Protocol/Probe.h"

#include <QElapsedTimer>
#include <QString>

#include <memory>

class QFile;
class QJsonObject;

/// The running account of a scan for whoever started it: one JSON object a line, appended to the file that
/// the environment variable "FXPROBE_REPORT" names. Each line is with the system before the next plug-in
/// call, so that the last ones tell what a scanner that died was busy with. Without that variable nothing is
/// written. docs/report.md describes the lines; `ReportReader` reads them.
///
/// Belongs to the thread that scans.
class ProbeReport {
public:
    /// The process's report; closed at first.
    static ProbeReport &instance();
    ~ProbeReport();

    /// Opens the file for appending, and marks the start of a scan in it.
    FileResult open(const QString &path);
    /// Opens the file that "FXPROBE_REPORT" names, if it is set; a file that cannot be opened is logged.
    void openFromEnvironment();

    /// A format found so many files and will probe so many of them.
    void plan(PluginFormat format, std::size_t files, std::size_t probes);
    /// A plug-in, or a sub-plug-in, is about to be touched; by a worker of that number, where there are any.
    void begin(PluginFormat format, const EffectRecord &plugin, int worker = 0);
    /// The probe begun last, or the one that the worker began last, enters a stage.
    void stage(ProbeStage stage, int worker = 0);
    /// What came of a probe.
    void end(PluginFormat format, const EffectRecord &plugin, const ProbeOutcome &outcome, int worker = 0);
    /// A worker has ended, and why.
    void workerEnded(int worker, const QString &reason);
    /// A file is not a plug-in, which was seen without loading it.
    void skipped(PluginFormat format, const QString &path, const QString &reason);
    /// The scan was cancelled: it does not count as finished.
    void cancelled();
    /// A catalogue could not be written: the scan does not count as finished.
    void unwritten(const QString &path, const QString &reason);
    /// The scan list cannot be used, so that nothing is scanned.
    void unreadList(const QString &path, const QString &reason);
    /// The search waits for a folder, or a link, that gives no answer.
    void looking(const QString &path);
    /// A folder, or something in it, could not be searched.
    void unsearched(const QString &path, const QString &reason);
    /// Another scanner is at work on the same folder.
    void busy();
    /// The last line: all catalogues are written, unless something above said otherwise.
    void finish();

private:
    void write(const char *event, QJsonObject line);

    double now() const;

    std::unique_ptr<QFile> m_file;
    qint64 m_opened = 0; ///< ms since 1970 (UTC)
    QElapsedTimer m_sinceOpened;
    bool m_complete = true;
};
