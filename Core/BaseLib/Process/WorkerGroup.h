#pragma once

#include <QByteArray>
#include <QString>
#include <QStringList>

#include <chrono>
#include <memory>
#include <optional>
#include <vector>

/// How a worker process ended.
struct WorkerEnd {
    bool crashed = false;  ///< something from outside its own code ended it: a signal, an unhandled fault
    bool isKilled = false; ///< ended by force, from outside: no fault of its own says so
    int code = 0;          ///< exit code; of a crash the signal (POSIX) or the status code (Windows)
    QString text;          ///< in words, as far as the system has any
};

/// Something that came from a worker.
struct WorkerEvent {
    int worker = 0;
    QByteArray data;              ///< bytes of its channel
    std::optional<WorkerEnd> end; ///< set when it has ended; nothing comes from it after that
};

/// What a worker takes of the machine, with the processes that it started.
struct WorkerUse {
    int children = 0;  ///< that run now; counted to some hundreds only
    qint64 memory = 0; ///< resident, in bytes; 0 when the system does not tell
};

/// Worker processes: copies of a program that talk to this process through a channel each, and to nobody
/// else. A worker leads a session of its own (on Windows a job), its input is the null device, what it prints
/// is kept, and of our descriptors it holds the channel only. While this process lives, nothing outlives its
/// worker: what the worker started is ended with it, also what went into a session of its own. When this
/// process is killed, its workers are ended by the system.
///
/// Used on one thread, which must live as long as the workers do: the system ends them with it.
class WorkerGroup {
public:
    /// `program` is a full path. Workers find their channel by `WorkerChannel`.
    WorkerGroup(const QString &program, const QStringList &arguments);
    /// Ends all workers.
    ~WorkerGroup();
    WorkerGroup(const WorkerGroup &) = delete;
    WorkerGroup &operator=(const WorkerGroup &) = delete;

    /// Starts a worker; its number, or nothing with the system's reason.
    std::optional<int> start(QString &reason);
    /// Sends bytes through a worker's channel, without waiting for the worker to read them: what it does not
    /// take at once goes out in `wait`. False when it takes none any more.
    bool send(int worker, const QByteArray &bytes);
    /// What came since the last call; waits for something until the time has run out.
    std::vector<WorkerEvent> wait(std::chrono::milliseconds timeout);
    /// Ends a worker at once, with everything that it started. Its end comes as an event.
    void end(int worker);
    /// The last lines that a worker printed that has ended.
    QString output(int worker) const;
    /// What a worker takes now. Takes some milliseconds at most, whatever the worker started: of many
    /// processes the memory of some is as old as the call before, or not known yet.
    WorkerUse use(int worker);

private:
    struct Private;
    std::unique_ptr<Private> m_private;
};

/// A worker's own end of its channel.
class WorkerChannel {
public:
    /// The environment variable that makes a process a worker.
    static constexpr char kVariable[] = "FXPROBE_WORKER";
    /// Where the channel of a new worker lies (POSIX): the first descriptor behind the standard ones.
    static constexpr int kDescriptor = 3;

    /// Whether this process was started as a worker.
    static bool isThere();
    /// Only where `isThere`.
    WorkerChannel();
    /// Closes the channel; a process that does not end then is ended.
    ~WorkerChannel();
    WorkerChannel(const WorkerChannel &) = delete;
    WorkerChannel &operator=(const WorkerChannel &) = delete;

    /// Waits for bytes; empty when the other end is gone.
    QByteArray read();
    /// False when the other end is gone.
    bool write(const QByteArray &bytes);

private:
    qintptr m_handle;
};
