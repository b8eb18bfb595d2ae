#pragma once

#include "Main/AudioEngineController/Effects/Launcher/ScannerLauncher.h"
#include "Main/AudioEngineController/Effects/Protocol/ReportReader.h"

#include <QString>
#include <QStringList>

#include <functional>
#include <map>
#include <optional>
#include <tuple>
#include <variant>
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
    QString reason; ///< why it failed; empty: it did not
    ProbeStatus status = ProbeStatus::Failed;
    double milliseconds = -1;        ///< -1: it did not come to its end
    int records = 0;                 ///< so many plug-ins of it work
    int worker = 0;                  ///< that asked it; 0: the scanner itself
    bool isLoaded = false;           ///< it entered a stage; else it was seen without loading it
    std::optional<std::size_t> span; ///< the place of the last attempt in `ScanAccount::spans`
};

/// One attempt at a plug-in or sub-plug-in. Times are milliseconds since the account began.
struct ProbeSpan {
    PluginKey key;
    int worker = 0; ///< 0: the scanner itself
    double begin = 0;
    double end = -1;                   ///< -1: it goes on
    std::optional<ProbeStatus> status; ///< nothing where it ended without a verdict, to be asked again
    bool isLoaded = false;             ///< it entered a stage
};

/// What a scanner found of one format.
struct PlannedFormat {
    PluginFormat format = PluginFormat::Unknown;
    int files = 0;  ///< found
    int probes = 0; ///< to be made from now on
};

/// A probe that began, with what had been dealt with and was planned then.
struct BegunProbe {
    PluginKey key;
    int done = 0;
    int planned = 0;
};

/// Something that came to pass: a plan, or a plug-in whose probe has ended.
using ScanNews = std::variant<PlannedFormat, PluginKey>;

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
    const PluginKey *current() const
    {
        return m_open.empty() ? nullptr : &innermost(m_open.front().worker)->key;
    }
    /// The probes that began since the last call, in order.
    std::vector<BegunProbe> takeBegun();
    /// What came to pass since the last call, in order. A plug-in can come twice: when it ends the scanner
    /// after its probe.
    std::vector<ScanNews> takeNews();
    /// All attempts, in the order in which they began.
    const std::vector<ProbeSpan> &spans() const { return m_spans; }
    /// When the last line was written, in milliseconds since the account began.
    double lastTime() const { return m_lastTime; }
    /// Milliseconds since the account began.
    double now() const;
    /// Files dealt with, and files planned, of all formats planned so far.
    int done() const { return m_done; }
    int planned() const { return m_planned; }

    /// The last scanner wrote all its catalogues.
    bool isFinished() const { return m_finished; }
    /// The last scanner ended as it should without having finished; where `problems` tells nothing, because
    /// somebody cancelled it: its window was closed, for example.
    bool hasGivenUp() const { return m_givenUp; }
    /// The last scanner found another one at work.
    bool isBusy() const { return m_busy; }
    /// The folder, or link, for which the search waits; empty when it waits for none.
    const QString &looking() const { return m_looking; }
    /// What kept a scanner from its work; one sentence each.
    const QStringList &problems() const { return m_problems; }

    const std::map<PluginKey, ProbeAccount> &probes() const { return m_probes; }
    /// What became of a probe; null when there was none.
    const ProbeAccount *find(const PluginKey &key) const;
    /// Whether the file was loaded.
    bool wasProbed(PluginFormat format, const QString &path) const;

private:
    /// A probe under way.
    struct Open {
        int worker;
        PluginKey key;
        std::size_t span;
    };

    void takeLine(const ReportLine &line);
    void begin(const ReportLine &line);
    void end(const ReportLine &line);
    void closeOpen(const std::function<bool(const Open &)> &isOver, std::optional<ProbeStatus> status);
    void setStatus(const PluginKey &key, ProbeStatus status);
    void addProblem(const QString &problem);
    const Open *innermost(int worker) const;

    ReportReader m_report;
    const double m_began; ///< ms since 1970 (UTC)
    double m_lastTime = 0;
    std::vector<Open> m_open; ///< the oldest first
    std::vector<BegunProbe> m_begun;
    std::vector<ScanNews> m_news;
    std::vector<ProbeSpan> m_spans;
    std::map<PluginKey, ProbeAccount> m_probes;
    QStringList m_problems;
    QString m_looking;
    int m_done = 0;
    int m_planned = 0;
    bool m_finished = false;
    bool m_givenUp = false;
    bool m_busy = false;
};
