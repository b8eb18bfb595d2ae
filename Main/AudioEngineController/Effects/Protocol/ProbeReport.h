#pragma once

#include "Core/BaseLib/Files/TextFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeStage.h"

#include <QElapsedTimer>
#include <QString>

#include <memory>

class QFile;
class QJsonObject;
class ProbeEntry;

/// The running account of a scan for whoever started it: one JSON object a line, appended to the file that
/// the environment variable "FXPROBE_REPORT" names. Each line is with the system before the next plug-in
/// call, so that the last ones tell what a scanner that died was busy with. Without that variable nothing is
/// written. docs/report.md describes the lines.
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
    bool isOpen() const { return m_file != nullptr; }

    /// Why the probe under way fails, as a user can understand it; the first reason is the one that counts.
    /// Nothing happens outside a probe.
    static void reason(const QString &text);
    /// The probe under way enters a stage.
    static void stage(ProbeStage stage);

    /// A format found so many files and will probe so many of them.
    void plan(const char *format, std::size_t files, std::size_t probes);
    /// A file is no plug-in, which was seen without loading it.
    void skipped(const char *format, const QString &path, const QString &reason);
    /// The scan was cancelled: it does not count as finished.
    void cancelled();
    /// A catalogue could not be written: the scan does not count as finished.
    void unwritten(const QString &path, const QString &reason);
    /// Another scanner is at work on the same folder.
    void busy();
    /// The last line: all catalogues are written, unless something above said otherwise.
    void finish();

private:
    friend class ProbeEntry;
    void write(const char *event, QJsonObject line);

    std::unique_ptr<QFile> m_file;
    ProbeEntry *m_current = nullptr; ///< innermost probe under way
    bool m_complete = true;
};

/// The account of one probe, from before the plug-in is touched until it has been unloaded. Probes nest: a
/// sub-plug-in's lies inside its shell's.
class ProbeEntry {
public:
    /// `format` is "vst3" or "vst2"; of the plug-in, path and sub-plug-in count.
    ProbeEntry(const char *format, const EffectRecord &plugin);
    ~ProbeEntry();
    ProbeEntry(const ProbeEntry &) = delete;
    ProbeEntry &operator=(const ProbeEntry &) = delete;

    /// What came of it: so many records say that the plug-in works.
    void listed(std::size_t records) { m_records = records; }
    /// It is no plug-in of this format and gets no record.
    void isNoPlugin() { m_noPlugin = true; }

private:
    friend class ProbeReport;

    const char *m_format;
    QString m_path;
    quint32 m_subId;
    ProbeEntry *m_outer;
    QElapsedTimer m_timer;
    std::size_t m_records = 0;
    bool m_noPlugin = false;
    QString m_reason;
};
