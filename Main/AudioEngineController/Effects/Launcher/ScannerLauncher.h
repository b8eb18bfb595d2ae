#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/Protocol/Probe.h"

#include <QString>
#include <QStringList>

#include <atomic>
#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <vector>

class MarkerWatch;
class ScannerProcess;

/// A plug-in that a scanner was busy with when it ended.
struct ScanCulprit {
    PluginFormat format = PluginFormat::Unknown;
    EffectRecord plugin; ///< path, file time, name and sub-plug-in, as its crash marker says
    QString reason;      ///< in words, what it did: one phrase
    ProbeStatus status = ProbeStatus::Crashed;
};

/// How one run of the scanner ended.
struct ScannerRunEnd {
    enum class How {
        NotStarted, ///< the program could not be started; `code` and `text` are the system's reason
        Exited,     ///< by itself, with exit code `code`
        Crashed,    ///< by a signal (POSIX) or an unhandled fault; `code` is its number
        TimeLimit,  ///< by us: it was busy with one plug-in for too long
        Cancelled,  ///< by us: the user wants no scan any more
        Skipped,    ///< by us: the user waits no longer for the plug-in that it was busy with
    };
    How how = How::NotStarted;
    int code = 0;
    QString text;
    std::vector<ScanCulprit> culprits;

    /// In words, for the log and for people.
    QString description() const;
};

/// Runs the scanner on a scan list, again and again while plug-ins end it: each run knows the culprit of the
/// one before. The launcher knows nothing of catalogues; `PluginHost` runs it on a thread of its own.
class ScannerLauncher {
public:
    /// Maximum number of scanner runs; markers that survive even then are left for the next scan.
    static constexpr int kMaxRuns = 10;

    /// What the runs need. `program` and `scanList` are full paths.
    struct Job {
        QString program;
        QString scanList;
        QString effectsFolder;
        int probeLimit = 0;                  ///< seconds that one plug-in may take; 0: for ever
        std::function<void()> writeScanList; ///< called before each run
        int jobs = 0;        ///< workers that the scanner has; 0: it probes in its own process
        int memoryLimit = 0; ///< MiB that a worker may hold; 0: any
        std::map<QString, QString> environment = {}; ///< what the scanner gets besides this process's
    };

    /// Runs until a run leaves no marker, the runs are used up, or somebody cancels. On the thread that
    /// called.
    void run(const Job &job);

    /// Asks `run` to end at its next look, which is a second away at most. Any thread.
    void cancel() { m_cancelled = true; }
    bool isCancelled() const { return m_cancelled; }
    /// Asks the scanner at work to give up on a file, which blames nobody: the next scan asks it again. One
    /// that has no workers is ended for it, and another run goes on. Any thread.
    void skip(const QString &path);
    /// Forgets earlier requests and earlier runs.
    void reset();

    /// How the runs ended so far. Any thread.
    std::vector<ScannerRunEnd> ends() const;

private:
    std::optional<ScannerRunEnd::How> runOnce(const Job &job);
    bool waitStep(ScannerProcess &scanner);
    bool passSkipsOn(ScannerProcess &scanner);
    bool isSkipAtHand(const MarkerWatch &watch) const;
    void waitForEnd(const Job &job, ScannerProcess &scanner, MarkerWatch &watch, ScannerRunEnd &end);
    bool isOverLimit(const Job &job, const MarkerWatch &watch) const;
    void add(const ScannerRunEnd &end);

    std::atomic<bool> m_cancelled{false};
    mutable std::mutex m_mutex; ///< of the ends and the skips
    std::vector<ScannerRunEnd> m_ends;
    QStringList m_skips; ///< files to give up on, in this launch
    int m_passedOn = 0;  ///< so many of them the present run was told
};
