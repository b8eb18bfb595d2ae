#pragma once

#include "Main/AudioEngineController/Effects/Launcher/ScannerLauncher.h"
#include "Main/AudioEngineController/Effects/Protocol/ReportReader.h"

#include <QString>
#include <QStringList>

#include <map>
#include <tuple>
#include <vector>

/// Tells one plug-in, or sub-plug-in, of a file from all others.
struct PluginKey {
    PluginFormat format = PluginFormat::Unknown;
    QString path;
    quint32 subId = 0;

    bool operator<(const PluginKey &other) const
    {
        return std::tie(format, path, subId) < std::tie(other.format, other.path, other.subId);
    }
    bool operator==(const PluginKey &other) const { return !(*this < other) && !(other < *this); }
};

PluginKey pluginKey(const ScanCulprit &culprit);

/// What a scan said of one probe.
struct ProbeAccount {
    QString subName;
    QString reason;           ///< why it failed; empty: it did not
    double milliseconds = -1; ///< -1: it did not come to its end
    int records = 0;          ///< so many plug-ins of it work
    bool noPlugin = false;    ///< no plug-in of its format
    bool isSkipped = false;   ///< by the user
    bool isLoaded = false;    ///< it entered a stage; else it was seen without loading it
};

/// Follows the report that scanners write while they work.
class ScanAccount {
public:
    /// Follows the file from its present end on.
    explicit ScanAccount(const QString &reportFile);

    /// Reads what was written since the last call.
    void update();
    /// Takes in how a scanner ended: what it was busy with is to blame. The next one may be at work already.
    void scannerEnded(const ScannerRunEnd &end);

    /// The probe under way for the longest, or what of it is asked now; null when there is none.
    const PluginKey *current() const { return m_open.empty() ? nullptr : innermost(m_open.front().worker); }
    /// The probes that began since the last call, in order.
    std::vector<PluginKey> takeBegun();
    /// Files dealt with, and files planned, of all formats planned so far.
    int done() const { return m_done; }
    int planned() const { return m_planned; }

    /// The last scanner wrote all its catalogues.
    bool isFinished() const { return m_finished; }
    /// The last scanner found another one at work.
    bool isBusy() const { return m_busy; }
    /// What kept a scanner from its work; one sentence each.
    const QStringList &problems() const { return m_problems; }

    const std::map<PluginKey, ProbeAccount> &probes() const { return m_probes; }
    /// What became of a probe; null when there was none.
    const ProbeAccount *find(const PluginKey &key) const;
    /// Whether the file was loaded.
    bool wasProbed(PluginFormat format, const QString &path) const;

private:
    void takeLine(const ReportLine &line);
    void begin(const ReportLine &line);
    void end(const ReportLine &line);
    void addProblem(const QString &problem);
    const PluginKey *innermost(int worker) const;

    ReportReader m_report;
    /// A probe under way.
    struct Open {
        int worker;
        PluginKey key;
    };
    std::vector<Open> m_open; ///< the oldest first
    std::vector<PluginKey> m_begun;
    std::map<PluginKey, ProbeAccount> m_probes;
    QStringList m_problems;
    int m_done = 0;
    int m_planned = 0;
    bool m_finished = false;
    bool m_busy = false;
};
