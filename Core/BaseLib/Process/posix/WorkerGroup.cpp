#include "Core/BaseLib/Process/WorkerGroup.h"

#include "Core/BaseLib/Process/posix/ChildProcesses.h"
#include "Core/BaseLib/Process/posix/WorkerStart.h"

#include <QDeadlineTimer>
#include <QFile>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <map>
#include <set>
#include <utility>

#include <poll.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

constexpr int kMaxOutput = 2000; ///< bytes that are kept of what a worker prints
constexpr int kBlock = 65536;
/// How often a worker's end is looked for that shows in no descriptor: a plug-in may close them all.
constexpr int kLook = 50; // ms
/// The same while a worker's channel is closed, which is mostly the first sign of its end.
constexpr int kNearEnd = 2; // ms
/// What a worker that has closed its channel gets to end by itself: its own exit status says more than ours.
constexpr int kGrace = 500; // ms
/// What an ended process gets to be gone: the system may hold it, for example on a network drive.
constexpr int kPatience = 2000; // ms
constexpr useconds_t kNap = 1000;
/// More than a socket or a pipe keeps of what an ended worker wrote. Others may hold its other end, and write
/// on.
constexpr int kMostLastBlocks = 64;

struct Worker {
    pid_t process = -1;
    Descriptor channel;
    Descriptor printed;
    QByteArray unsent;
    QByteArray output;
    SharedMemory memory;                           ///< its own and that of what it started
    QDeadlineTimer grace{QDeadlineTimer::Forever}; ///< it ends by itself until then
};

/// Numbers are never used twice, in all groups of this process.
std::atomic<int> lastNumber{0};

/// What is there to be read without waiting; empty and the descriptor closed when the other end is gone.
QByteArray readSome(Descriptor &descriptor)
{
    QByteArray bytes(kBlock, Qt::Uninitialized);
    ssize_t count = -1;
    do
        count = ::read(descriptor.number(), bytes.data(), static_cast<std::size_t>(bytes.size()));
    while (count < 0 && errno == EINTR);
    if (count > 0)
        return bytes.left(static_cast<int>(count));
    if (count == 0 || errno != EAGAIN)
        descriptor.close();
    return QByteArray();
}

/// What is still there to be read when the writer has ended.
QByteArray readLast(Descriptor &descriptor)
{
    QByteArray all;
    for (int count = 0; descriptor.isOpen() && count < kMostLastBlocks; ++count) {
        const QByteArray bytes = readSome(descriptor);
        if (bytes.isEmpty())
            break;
        all += bytes;
    }
    return all;
}

/// Sends as much as the other end takes without waiting. When it is gone, that shows in reading.
void sendSome(Worker &worker)
{
    const ssize_t count = ::send(worker.channel.number(), worker.unsent.constData(),
                                 static_cast<std::size_t>(worker.unsent.size()), MSG_NOSIGNAL);
    if (count > 0)
        worker.unsent.remove(0, static_cast<int>(count));
    else if (count < 0 && errno != EAGAIN && errno != EINTR)
        worker.unsent.clear();
}

WorkerEnd endOf(int status)
{
    WorkerEnd end;
    end.crashed = WIFSIGNALED(status);
    end.isKilled = end.crashed && WTERMSIG(status) == SIGKILL;
    end.code = end.crashed ? WTERMSIG(status) : WEXITSTATUS(status);
    if (end.crashed)
        end.text =
            QStringLiteral("signal %1 (%2)").arg(end.code).arg(QString::fromLocal8Bit(strsignal(end.code)));
    return end;
}

} // namespace

struct WorkerGroup::Private {
    QByteArray program;
    QList<QByteArray> arguments;
    std::map<int, Worker> workers;
    std::map<int, QString> outputs; ///< of those that have ended
    std::set<pid_t> before;         ///< children of this process that are not ours
    std::map<pid_t, int> adoptedBy; ///< the workers of what came to this process, by their environment
    bool mayHaveOrphans = false;

    void readAll(int timeout, std::vector<WorkerEvent> &events);
    bool reap(int number, std::vector<WorkerEvent> &events);
    std::map<pid_t, int> adopted();
    int ownerOf(pid_t child, pid_t session);
    void endOrphans();
};

WorkerGroup::WorkerGroup(const QString &program, const QStringList &arguments)
    : m_private(std::make_unique<Private>())
{
    m_private->program = QFile::encodeName(program);
    for (const QString &argument : arguments)
        m_private->arguments.append(QFile::encodeName(argument));
    m_private->before = childrenOf(getpid());
    prctl(PR_SET_CHILD_SUBREAPER, 1); // what a worker leaves behind comes to us
    openStandardDescriptors();
    keepEndedChildren();
}

WorkerGroup::~WorkerGroup()
{
    for (auto &entry : m_private->workers)
        ::kill(-entry.second.process, SIGKILL);
    const QDeadlineTimer patience(kPatience);
    std::vector<WorkerEvent> unheard;
    do {
        for (auto each = m_private->workers.begin(); each != m_private->workers.end();) {
            const int number = (each++)->first;
            m_private->reap(number, unheard);
        }
        m_private->endOrphans();
        if (m_private->workers.empty() && !m_private->mayHaveOrphans)
            return;
        usleep(kNap);
    } while (!patience.hasExpired());
}

std::optional<int> WorkerGroup::start(QString &reason)
{
    const int number = ++lastNumber;
    StartedWorker started = startWorker(m_private->program, m_private->arguments, number);
    if (started.error != 0) {
        reason = QString::fromLocal8Bit(std::strerror(started.error));
        return std::nullopt;
    }
    Worker &worker = m_private->workers[number];
    worker.process = started.process;
    worker.channel = std::move(started.channel);
    worker.printed = std::move(started.printed);
    return number;
}

bool WorkerGroup::send(int worker, const QByteArray &bytes)
{
    const auto found = m_private->workers.find(worker);
    if (found == m_private->workers.end() || !found->second.channel.isOpen())
        return false;
    found->second.unsent += bytes;
    sendSome(found->second);
    return true;
}

void WorkerGroup::Private::readAll(int timeout, std::vector<WorkerEvent> &events)
{
    std::vector<pollfd> polled;
    std::vector<std::pair<int, bool>> owners; ///< worker, and whether it is its channel
    for (auto &[number, worker] : workers) {
        for (const bool isChannel : {true, false})
            if (const Descriptor &each = isChannel ? worker.channel : worker.printed; each.isOpen()) {
                const bool sends = isChannel && !worker.unsent.isEmpty();
                polled.push_back({each.number(), static_cast<short>(sends ? POLLIN | POLLOUT : POLLIN), 0});
                owners.emplace_back(number, isChannel);
            }
    }
    if (poll(polled.data(), polled.size(), timeout) <= 0)
        return;
    for (std::size_t index = 0; index < polled.size(); ++index) {
        if (polled[index].revents == 0)
            continue;
        const auto [number, isChannel] = owners[index];
        Worker &worker = workers.at(number);
        if (polled[index].revents & POLLOUT)
            sendSome(worker);
        const QByteArray bytes = readSome(isChannel ? worker.channel : worker.printed);
        if (!isChannel)
            worker.output = (worker.output + bytes).right(kMaxOutput);
        else if (!bytes.isEmpty())
            events.push_back({number, bytes, std::nullopt});
        else if (!worker.channel.isOpen())
            worker.grace.setRemainingTime(kGrace); // nothing can come from it any more
    }
}

/// Takes in a worker's end, if it has come.
bool WorkerGroup::Private::reap(int number, std::vector<WorkerEvent> &events)
{
    Worker &worker = workers.at(number);
    if (worker.grace.hasExpired())
        ::kill(-worker.process, SIGKILL);
    siginfo_t info = {};
    const int waited = waitid(P_PID, static_cast<id_t>(worker.process), &info, WEXITED | WNOHANG | WNOWAIT);
    const bool isTaken = waited != 0 && errno == ECHILD; // by somebody who waits for every child
    if (!isTaken && info.si_pid == 0)
        return false;
    int status = 0;
    if (!isTaken) {
        ::kill(-worker.process, SIGKILL); // its group, while the number is still its own
        waitpid(worker.process, &status, 0);
    }
    if (const QByteArray bytes = readLast(worker.channel); !bytes.isEmpty())
        events.push_back({number, bytes, std::nullopt});
    worker.output = (worker.output + readLast(worker.printed)).right(kMaxOutput);
    outputs[number] = QString::fromLocal8Bit(worker.output).trimmed();
    workers.erase(number);
    events.push_back({number, QByteArray(), endOf(status)});
    mayHaveOrphans = true;
    return true;
}

/// The children of this process that workers started, which come here when their parents have ended, with the
/// numbers of these workers; 0 where nothing tells. A worker leads a session of its own, and from a session
/// one only gets to a new one: what is in ours was never a worker's.
std::map<pid_t, int> WorkerGroup::Private::adopted()
{
    std::map<pid_t, int> found;
    const pid_t ours = getsid(0);
    for (const pid_t child : childrenOf(getpid())) {
        const pid_t session = getsid(child);
        const bool isWorker = std::any_of(workers.begin(), workers.end(), [child](const auto &entry) {
            return entry.second.process == child;
        });
        if (isWorker || session == ours || before.count(child) != 0)
            continue;
        if (waitpid(child, nullptr, WNOHANG) == child)
            adoptedBy.erase(child); // it has ended
        else
            found[child] = ownerOf(child, session);
    }
    return found;
}

/// The worker that a child is of; 0 when nothing tells.
int WorkerGroup::Private::ownerOf(pid_t child, pid_t session)
{
    for (const auto &[number, worker] : workers)
        if (worker.process == session)
            return number;
    const auto [owner, isNew] = adoptedBy.try_emplace(child, 0);
    if (isNew)
        owner->second = workerOf(child);
    return owner->second;
}

/// Ends what ended workers left behind: orphans come to this process, and theirs when they have ended.
void WorkerGroup::Private::endOrphans()
{
    if (!mayHaveOrphans)
        return;
    mayHaveOrphans = false;
    for (const auto &[child, worker] : adopted()) {
        if (worker != 0 && outputs.count(worker) == 0)
            continue; // its worker is there
        ::kill(child, SIGKILL);
        mayHaveOrphans = true; // it is looked at again until it is gone
    }
}

std::vector<WorkerEvent> WorkerGroup::wait(std::chrono::milliseconds timeout)
{
    const QDeadlineTimer deadline(timeout);
    std::vector<WorkerEvent> events;
    do {
        // Orphans are looked at often as well: some start others as fast as they can.
        const bool isNearEnd = m_private->mayHaveOrphans ||
                               std::any_of(m_private->workers.begin(), m_private->workers.end(),
                                           [](const auto &entry) { return !entry.second.channel.isOpen(); });
        const qint64 look = isNearEnd ? kNearEnd : kLook;
        m_private->readAll(static_cast<int>(std::min(deadline.remainingTime(), look)), events);
        for (auto each = m_private->workers.begin(); each != m_private->workers.end();) {
            const int number = (each++)->first;
            m_private->reap(number, events);
        }
        m_private->endOrphans();
    } while (events.empty() && !deadline.hasExpired());
    return events;
}

void WorkerGroup::end(int worker)
{
    if (const auto found = m_private->workers.find(worker); found != m_private->workers.end())
        ::kill(-found->second.process, SIGKILL);
}

QString WorkerGroup::output(int worker) const
{
    const auto ended = m_private->outputs.find(worker);
    return ended == m_private->outputs.end() ? QString() : ended->second;
}

WorkerUse WorkerGroup::use(int worker)
{
    const auto found = m_private->workers.find(worker);
    if (found == m_private->workers.end())
        return {};
    const pid_t process = found->second.process;
    std::set<pid_t> started = childrenOf(process);
    for (const auto &[child, owner] : m_private->adopted())
        if (owner == worker)
            started.insert(child);
    if (started.empty())
        return {0, residentMemoryOf(process)};
    std::set<pid_t> all = withDescendants(started);
    const int children = static_cast<int>(all.size());
    all.insert(process);
    return {children, std::max(found->second.memory.of(all), residentMemoryOf(process))};
}
