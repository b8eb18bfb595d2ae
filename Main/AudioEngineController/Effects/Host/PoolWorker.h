#pragma once

#include "Core/BaseLib/Process/CrashReport.h"
#include "Core/BaseLib/Process/WorkerGroup.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeChannel.h"

#include <QElapsedTimer>

/// A worker process of a pool, as far as the pool knows it: what it is busy with, what it said, and what that
/// says of the plug-in at hand and of the worker.
struct PoolWorker {
    ChannelReader reader;
    bool isReady = false;
    int probed = 0;                    ///< jobs that it has ended
    std::optional<std::size_t> job;    ///< the one that it is busy with, by its place in the pool
    QString path;                      ///< of that one, or of the last one
    ProbeOutcome outcome;              ///< of that one, as far as it came
    std::optional<EffectRecord> child; ///< the sub-plug-in that is asked or closed
    QStringList probedPaths;           ///< of the jobs before
    QElapsedTimer silent;              ///< since it last said something
    QElapsedTimer sinceJob;            ///< since the job was handed out
    qint64 freshMemory = 0;            ///< bytes of resident memory before its first job
    QString endedFor;                  ///< why we ended it; empty: we did not
    bool isOverdue = false;            ///< ended by us for want of an answer
    bool isLeaving = false;            ///< ended by us; what it had to say was said

    void begin(std::size_t newJob, const QString &newPath);
    /// The job has ended as it should.
    void end();
    double millisecondsOfJob() const { return static_cast<double>(sinceJob.nsecsElapsed()) / 1e6; }

    /// Takes note of what it said about its job. False for what no probe can have said: a plug-in may write
    /// anything into the channel. From then on nothing of it counts.
    bool note(const ChannelMessage &message);
    /// Whether somebody else than the probe wrote into the channel.
    bool isGarbled() const { return m_isGarbled || reader.isBroken(); }

    /// Why it takes too much for the plug-in to go on; empty when it does not. `memoryLimit` in bytes; 0:
    /// none.
    static QString excessOf(const WorkerUse &use, qint64 memoryLimit);
    /// Why it asks nobody else after a job; empty when it may. What a plug-in left behind would meet a
    /// stranger's probe.
    QString whySpent(const ProbeOutcome &last, const WorkerUse &use) const;
    /// Why it ended, in words, and where it crashed, which goes to the log, too. `printed`: its last lines.
    CrashReport whyEnded(const WorkerEnd &how, QString printed) const;

private:
    bool isBelievable(const ChannelMessage &message) const;

    int m_messages = 0; ///< about the job
    bool m_isGarbled = false;
};
