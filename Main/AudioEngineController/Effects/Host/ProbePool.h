#pragma once

#include "Main/AudioEngineController/Effects/Host/PoolWorker.h"

#include <deque>
#include <map>
#include <set>
#include <vector>

/// Hears what becomes of its jobs, which it knows by their places among them, on the thread that runs the
/// pool.
class IPoolListener {
public:
    virtual ~IPoolListener() = default;

    /// What comes of a job without the module being loaded; nothing when a worker has to ask it.
    virtual std::optional<ProbeOutcome> look(std::size_t job) = 0;
    /// A worker begins with a job, or begins again with it.
    virtual void jobBegins(std::size_t job, int worker) = 0;
    virtual void stageEntered(std::size_t job, int worker, ProbeStage stage) = 0;
    virtual void childBegins(std::size_t job, int worker, const EffectRecord &child) = 0;
    virtual void childEnds(std::size_t job, int worker, const ProbeOutcome &outcome) = 0;
    virtual void classBegins(std::size_t job, int worker, const QString &name) = 0;
    virtual void classAnnounced() = 0;
    /// What came of a job, in whatever order they end; each once, but those that a cancel left waiting.
    virtual void jobEnds(std::size_t job, int worker, const ProbeOutcome &outcome) = 0;
    /// A worker has ended, which comes after what became of its job.
    virtual void workerEnds(int worker, const QString &reason) = 0;
    /// Of all jobs that are at work this one is now the longest.
    virtual void becomesLongest(std::size_t job) = 0;
    /// Called now and then.
    virtual void turn() = 0;
    /// True when no more jobs are to be begun.
    virtual bool isCancelled() = 0;
    /// True when a job that is at work is to be given up, which blames nobody.
    virtual bool isSkipped(std::size_t job) = 0;
};

/// What a pool is to ask, and when.
struct PoolJob {
    ProbeJob job;
    bool isAlone = false;  ///< before all others, and while nothing else is at work
    double expectedMs = 0; ///< how long it will take, by a guess: the slowest begin first
};

/// Makes outcomes of jobs in worker processes, several at once. A plug-in that ends its worker, or gives no
/// answer, costs nobody else anything: it is asked once more in a worker that asked nobody before it, and
/// only what happens there is held against it.
///
/// Several listeners share one pool: while one waits for its jobs, workers that it does not need are busy
/// with those of others. Used for one scan.
class ProbePool {
public:
    struct Settings {
        QString program;                    ///< full path of the scanner, which is its own worker
        int workers = 1;                    ///< at most so many at once
        std::chrono::milliseconds limit{0}; ///< that a plug-in may be silent; 0: for ever
        qint64 memoryLimit = 0;             ///< bytes of resident memory that a worker may hold; 0: any
    };

    explicit ProbePool(Settings settings);
    ~ProbePool();

    /// Adds jobs, which begin when somebody runs the pool. The listener must live until it withdraws.
    void add(std::vector<PoolJob> jobs, IPoolListener &listener);
    /// Works until all jobs of the listener have ended, or some time after it cancelled the scan, which ends
    /// those of all listeners. When nothing is left of anybody's, the workers are ended. False, with the
    /// reason in the log, when no worker can be had: the jobs that did not end are left.
    bool run(IPoolListener &listener);
    /// Ends what is left of a listener's jobs without a word to it.
    void withdraw(IPoolListener &listener);

    /// How many jobs were added, and how many of them have ended.
    std::size_t added() const { return m_jobs.size(); }
    std::size_t ended() const { return m_ended; }
    /// Whether no other job has been at work for longer.
    bool isLongest(const IPoolListener &listener, std::size_t job) const;

private:
    /// A job of a listener, with what must be left out by now.
    struct Job {
        PoolJob what;
        IPoolListener *listener;
        std::size_t place; ///< among the listener's
    };
    /// A job that waits for a worker.
    struct Waiting {
        std::size_t job;
        bool needsFreshWorker = false;
        bool isLookedAt = false;
    };

    ProbeJob &jobOf(std::size_t job) { return m_jobs[job].what.job; }
    const ProbeJob &jobOf(std::size_t job) const { return m_jobs[job].what.job; }
    IPoolListener &listenerOf(std::size_t job) { return *m_jobs[job].listener; }
    bool isBusy() const;
    bool isLeft(const IPoolListener &listener) const;
    std::optional<std::size_t> longest() const;
    void showLongest();
    void turn();
    void endJob(std::size_t job, int number, const ProbeOutcome &outcome);
    void endIdle();
    std::size_t nextFor(const PoolWorker &worker) const;
    void cancelJobs();
    void skipJobs();
    void cancelJob(std::size_t job, int number);
    void forgiveWait(qint64 turn);
    void lookAhead();
    void startWorkers();
    bool hasWorkers() const;
    void handOut();
    void handOut(int number, PoolWorker &worker, std::size_t index);
    void take(const WorkerEvent &event);
    void takeMessage(int number, PoolWorker &worker, const ChannelMessage &message);
    void finishJob(int number, PoolWorker &worker, const ProbeOutcome &outcome);
    void takeEnd(int number, const WorkerEnd &end);
    void endOverdue();
    void endExcessive();
    void endWorker(int number, PoolWorker &worker, const QString &reason);
    void askAgain(std::size_t job, const QString &reason, const PoolWorker &worker);
    void giveVerdict(std::size_t job, int number, const PoolWorker &worker, const CrashReport &report);

    const Settings m_settings;
    WorkerGroup m_group;
    std::map<int, PoolWorker> m_workers;
    std::deque<Waiting> m_waiting;
    std::vector<Job> m_jobs;
    std::size_t m_ended = 0;            ///< jobs
    std::optional<std::size_t> m_shown; ///< the longest job at work that was told of
    std::vector<IPoolListener *> m_listeners;
    /// The sub-plug-ins of a job that ended a worker each.
    std::map<std::size_t, std::vector<EffectRecord>> m_crashedChildren;
    std::set<std::size_t> m_killed; ///< jobs whose fresh worker was killed from outside
    bool m_isCancelled = false;
    bool m_hasGivenUp = false; ///< no worker can be had
    QElapsedTimer m_sinceCancel;
    IPoolListener *m_listener = nullptr; ///< that runs it
    int m_failedStarts = 0;
    QElapsedTimer m_sinceUse; ///< since it was looked at what workers take
};
