#pragma once

#include "Core/BaseLib/Process/ProcessState.h"
#include "Main/AudioEngineController/Effects/Host/AudioPluginHost.h"

#include <memory>
#include <vector>

class VProgressDisplay;

/// A file that a scan has to deal with.
struct ScanItem {
    QString path;
    QString fileTime;
    bool probe = true; ///< false: what is known is kept
    std::vector<EffectRecord>
        knownRecords; ///< what the previous catalogue says of the file, the one that speaks for it first
};

/// One scan of a host's folders: finds the files, has the format decide which to probe, and goes through them
/// with progress, cancel and interim writes. Used once, on the scan worker.
class FolderScan {
public:
    /// `format` names the format in the report.
    FolderScan(AudioPluginHost &host, const char *format);
    virtual ~FolderScan();
    FolderScan(const FolderScan &) = delete;
    FolderScan &operator=(const FolderScan &) = delete;

    /// True when the catalogue was written at least once. Never throws.
    bool run();

protected:
    /// Looks at the files found, in the order of the folders, keeps what is known of those that need no
    /// probe, and gives the rest.
    virtual std::vector<ScanItem> arrange(const QStringList &paths) = 0;
    /// Probes one file, or keeps it, as the item says. True when a record was added to the catalogue.
    virtual bool process(const ScanItem &item) = 0;
    /// Called when all items were processed, before the last write.
    virtual void complete() {}

    AudioPluginHost &host() { return m_host; }
    const char *format() const { return m_format; }
    const ProcessState &processState() const { return m_processState; }
    VProgressDisplay *progress() const { return m_progress.get(); }
    std::size_t itemCount() const { return m_items.size(); }
    /// Shows the range and value of the files again, after a file used the bar for itself.
    void showItemProgress();
    /// Adds what is known of a file to the effect list as it stands.
    void keep(const KnownList::Records &records);
    /// True when this run has probed the file.
    bool wasProbed(const QString &path) const { return m_probed.count(path) != 0; }
    /// Has interim writes carry a known record that this run has not settled yet.
    void addWaiting(const EffectRecord &record);
    /// True when the user, the host or the system asked the scan to stop.
    bool isCancelled() const;

private:
    void scan();
    QStringList findFiles() const;
    /// Keeps what is known of the files in folders that could not be read: they are neither found nor gone.
    void keepUnread();
    /// Has interim writes carry what is known of the items behind the present one.
    void collectWaiting();
    void reportPlan(std::size_t files) const;
    bool processItems();
    void processItem(const ScanItem &item);
    void finishCancelled();
    void finish();
    void write(Durability durability);
    void removeWaiting(const ScanItem &item);

    AudioPluginHost &m_host;
    const char *m_format;
    std::shared_ptr<FileFinder> m_finder;
    ProcessState m_processState;
    std::shared_ptr<VProgressDisplay> m_progress;
    std::vector<ScanItem> m_items;
    WaitingRecords m_waiting;
    std::set<QString, PathLess> m_probed; ///< paths
    std::size_t m_knownAtStart = 0;
    std::size_t m_done = 0; ///< items
    bool m_added = false;
    bool m_written = false;
};
