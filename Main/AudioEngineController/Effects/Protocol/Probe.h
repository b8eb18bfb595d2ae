#pragma once

#include "Core/BaseLib/Binary/ModuleFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeStage.h"

#include <QString>

#include <optional>
#include <set>
#include <utility>
#include <vector>

/// What a probe came to.
enum class ProbeStatus {
    Listed,    ///< it lists at least one plug-in
    Failed,    ///< it does not load, does not start, or lists nothing
    NoPlugin,  ///< the file is not a plug-in of this format
    Crashed,   ///< it ended the process that probed it
    NoAnswer,  ///< it gave no answer within the limit
    Cancelled, ///< the scan was cancelled while it was probed
    Skipped,   ///< a user passed over it
};

/// Whether a plug-in ended the process that probed it, or had to be ended with it.
constexpr bool isCrash(ProbeStatus status)
{
    return status == ProbeStatus::Crashed || status == ProbeStatus::NoAnswer;
}

/// One file to ask: everything that a format's probe needs to know.
struct ProbeJob {
    PluginFormat format = PluginFormat::Unknown;
    QString path;                 ///< the module: a file or a bundle
    QString fileTime;             ///< its time stamp; every record of the outcome carries it
    std::set<quint32> leftOut;    ///< sub-plug-ins of a shell that are listed by name and never loaded
    bool isLookedAt = false;      ///< `look` found nothing that speaks against loading it
    bool announceClasses = false; ///< each class is announced as it is listed, however few there are
};

/// Each class of a module with more classes than this is announced as it is listed.
inline constexpr int kManyClasses = 6;

/// What came of a job. It starts out as failed.
struct ProbeOutcome {
    /// What becomes of the catalogue where nothing was listed.
    enum class IfFailed {
        Record,    ///< a record of the file says that it does not work; it is asked again when it changes
        KeepKnown, ///< what was known stays as it is; the next scan asks again
        LookAgain, ///< as `Record`, without a time stamp: what is copied may be whole with the same one
    };

    ProbeStatus status = ProbeStatus::Failed;
    ProbeStage stage = ProbeStage::Load; ///< where it failed, if it did, else the last one entered
    QString reason;     ///< why it failed: one phrase without the path; empty when it did not
    QStringList frames; ///< where it crashed: the calls that led there, the innermost first, as `CrashReport`
                        ///< has them
    IfFailed ifFailed = IfFailed::Record;
    /// In the module's order, with path and file time. A sub-plug-in that failed or was left out has its name
    /// and identifier, and `working` is false; a file that failed as a whole has no record here.
    std::vector<EffectRecord> records;
    double milliseconds = 0;  ///< how long the job took; whoever runs the probe measures it
    bool leftThreads = false; ///< more threads run than before, and the module stays mapped
    bool leftModule = false;  ///< it stays mapped in its process although it was unloaded
    bool faulted = false;     ///< a call committed a hardware fault that was contained

    /// Of a file that a user passed over: what is known stays as it is, and the next scan asks.
    static ProbeOutcome skipped()
    {
        ProbeOutcome outcome;
        outcome.status = ProbeStatus::Skipped;
        outcome.reason = QStringLiteral("skipped by you");
        return outcome;
    }

    /// The first reason counts: what fails later follows from it.
    void fail(const QString &why)
    {
        if (reason.isEmpty())
            reason = why;
    }

    /// The stage of a failure stays: what comes after it only clears up.
    void enter(ProbeStage next)
    {
        if (reason.isEmpty())
            stage = next;
    }

    /// Of a file by what it tells before it is loaded; nothing when it is to be loaded.
    static std::optional<ProbeOutcome> ofFile(const ModuleInspection &file,
                                              IfFailed ifFailed = IfFailed::Record)
    {
        using Verdict = ModuleInspection::Verdict;
        if (file.isLoadable())
            return std::nullopt;
        ProbeOutcome outcome;
        outcome.reason = file.reason;
        outcome.ifFailed = ifFailed;
        if (file.verdict == Verdict::NoLibrary || file.verdict == Verdict::NoExport)
            outcome.status = ProbeStatus::NoPlugin;
        if (file.verdict == Verdict::CutShort || file.verdict == Verdict::Unopened ||
            file.verdict == Verdict::Absent)
            outcome.ifFailed = IfFailed::LookAgain;
        return outcome;
    }
};

/// Hears how a probe gets on, on the thread that probes, before the plug-in is called. Nothing that it does
/// may throw.
class IProbeObserver {
public:
    virtual ~IProbeObserver() = default;

    virtual void stageEntered(ProbeStage stage) = 0;
    /// A class of the module is asked next.
    virtual void classBegins(const QString &name) = 0;
    /// A class that is to be announced has been dealt with.
    virtual void classAnnounced() = 0;
    /// The module is a shell with so many sub-plug-ins.
    virtual void childrenFound(std::size_t count) = 0;
    /// A sub-plug-in is loaded next. `child` has the path, file time, sub-plug-in name and identifier.
    virtual void childBegins(const EffectRecord &child) = 0;
    /// What came of it: one record, and the reason where it failed.
    virtual void childEnds(const ProbeOutcome &outcome) = 0;
    /// A sub-plug-in is closed, at the end of the whole probe; and has been closed.
    virtual void childCloses(const EffectRecord &child) = 0;
    virtual void childClosed() = 0;
};

/// Asks one format's plug-ins. Touches no list, catalogue, marker, report or user interface.
class IPluginProbe {
public:
    virtual ~IPluginProbe() = default;

    /// What comes of a job without the module being loaded, by what its file tells; nothing when it is to be
    /// loaded. Any thread.
    virtual std::optional<ProbeOutcome> look(const ProbeJob & /*job*/) const { return std::nullopt; }
    /// Looks at the job's module, if nobody did, loads it, asks it and unloads it again. Never throws:
    /// whatever the plug-in throws is part of the outcome.
    ProbeOutcome run(const ProbeJob &job, IProbeObserver &observer)
    {
        std::optional<ProbeOutcome> seen = job.isLookedAt ? std::nullopt : look(job);
        return seen ? *std::move(seen) : ask(job, observer);
    }

private:
    virtual ProbeOutcome ask(const ProbeJob &job, IProbeObserver &observer) = 0;
};
