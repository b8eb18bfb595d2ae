#include "Main/AudioEngineController/Effects/Host/ProbePool.h"

#include "Core/BaseLib/Log/DebugLog.h"

#include <algorithm>

namespace {

constexpr std::chrono::milliseconds kLook(50);
/// What plug-ins at work get to end by themselves after a cancel.
constexpr qint64 kPatience = 2000; // ms
/// A turn that takes longer was held up.
constexpr qint64 kLongTurn = 500; // ms
/// What a worker gets to say that it is there.
constexpr qint64 kStartPatience = 30000; // ms
/// Starts in a row that may fail.
constexpr int kMaxFailedStarts = 3;

QString namesOf(const QStringList &paths)
{
    return paths.isEmpty() ? QStringLiteral("nobody") : paths.join(QStringLiteral(", "));
}

} // namespace

ProbePool::ProbePool(Settings settings)
    : m_settings(std::move(settings))
    , m_group(m_settings.program, QStringList(QLatin1String(kProbeWorkerArgument)))
{}

ProbePool::~ProbePool() = default;

bool ProbePool::isBusy() const
{
    return std::any_of(m_workers.begin(), m_workers.end(),
                       [](const auto &entry) { return entry.second.job.has_value(); });
}

bool ProbePool::isLeft(const IPoolListener &listener) const
{
    const auto isIts = [&](std::size_t job) { return m_jobs[job].listener == &listener; };
    return std::any_of(m_waiting.begin(), m_waiting.end(),
                       [&](const Waiting &waiting) { return isIts(waiting.job); }) ||
           std::any_of(m_workers.begin(), m_workers.end(),
                       [&](const auto &entry) { return entry.second.job && isIts(*entry.second.job); });
}

void ProbePool::add(std::vector<PoolJob> jobs, IPoolListener &listener)
{
    m_listeners.push_back(&listener);
    for (std::size_t place = 0; place < jobs.size(); ++place) {
        m_jobs.push_back({std::move(jobs[place]), &listener, place});
        m_waiting.push_back({m_jobs.size() - 1});
    }
    // A slow one that begins last is at work alone in the end. One worker keeps to the order of the plans.
    const bool isBySlowness = m_settings.workers > 1;
    std::stable_sort(m_waiting.begin(), m_waiting.end(), [&](const Waiting &left, const Waiting &right) {
        const PoolJob &a = m_jobs[left.job].what;
        const PoolJob &b = m_jobs[right.job].what;
        return a.isAlone != b.isAlone ? a.isAlone : isBySlowness && a.expectedMs > b.expectedMs;
    });
}

bool ProbePool::run(IPoolListener &listener)
{
    m_listener = &listener;
    while (!m_hasGivenUp && isLeft(listener)) {
        QElapsedTimer sinceTurn;
        sinceTurn.start();
        if (!m_isCancelled && listener.isCancelled()) {
            m_isCancelled = true;
            m_sinceCancel.start();
            m_waiting.clear();
        }
        if (m_isCancelled && m_sinceCancel.hasExpired(kPatience))
            cancelJobs();
        skipJobs();
        lookAhead();
        if (!isLeft(listener))
            break;
        turn();
        forgiveWait(sinceTurn.elapsed());
        endOverdue();
        endExcessive();
        m_hasGivenUp = !hasWorkers();
    }
    if (m_waiting.empty() && !isBusy())
        endIdle();
    m_listener = nullptr;
    return !m_hasGivenUp;
}

void ProbePool::turn()
{
    startWorkers();
    handOut();
    for (const WorkerEvent &event : m_group.wait(kLook))
        take(event);
    showLongest();
    for (IPoolListener *listener : m_listeners)
        listener->turn();
}

/// Workers that have nothing to do any more.
void ProbePool::endIdle()
{
    for (auto &[number, worker] : m_workers)
        if (!worker.isLeaving) {
            worker.isLeaving = true;
            endWorker(number, worker, QStringLiteral("nothing is left to be asked"));
        }
    QElapsedTimer patience;
    for (patience.start(); !m_workers.empty() && !patience.hasExpired(kPatience);)
        for (const WorkerEvent &event : m_group.wait(kLook))
            take(event);
}

void ProbePool::withdraw(IPoolListener &listener)
{
    const auto isIts = [&](std::size_t job) { return m_jobs[job].listener == &listener; };
    m_waiting.erase(std::remove_if(m_waiting.begin(), m_waiting.end(),
                                   [&](const Waiting &waiting) { return isIts(waiting.job); }),
                    m_waiting.end());
    for (auto &[number, worker] : m_workers) {
        if (!worker.job || !isIts(*worker.job))
            continue;
        worker.job.reset();
        worker.isLeaving = true;
        endWorker(number, worker, QStringLiteral("nobody waits for it any more"));
    }
    m_shown.reset();
    m_listeners.erase(std::remove(m_listeners.begin(), m_listeners.end(), &listener), m_listeners.end());
}

std::optional<std::size_t> ProbePool::longest() const
{
    const PoolWorker *first = nullptr;
    for (const auto &[number, worker] : m_workers)
        if (worker.job && (!first || worker.sinceJob < first->sinceJob))
            first = &worker;
    return first ? first->job : std::nullopt;
}

bool ProbePool::isLongest(const IPoolListener &listener, std::size_t job) const
{
    const std::optional<std::size_t> first = longest();
    return first && m_jobs[*first].listener == &listener && m_jobs[*first].place == job;
}

void ProbePool::showLongest()
{
    const std::optional<std::size_t> first = longest();
    if (first && first != m_shown)
        listenerOf(*first).becomesLongest(m_jobs[*first].place);
    m_shown = first;
}

void ProbePool::endJob(std::size_t job, int number, const ProbeOutcome &outcome)
{
    ++m_ended;
    listenerOf(job).jobEnds(m_jobs[job].place, number, outcome);
}

/// Where this process was held up, by a slow disk for example, what workers said meanwhile was not heard yet.
void ProbePool::forgiveWait(qint64 turn)
{
    if (turn < kLongTurn)
        return;
    for (auto &entry : m_workers)
        entry.second.silent.start();
}

/// Those at work had their time, and nobody is to blame.
void ProbePool::cancelJobs()
{
    for (auto &[number, worker] : m_workers) {
        if (!worker.job)
            continue;
        cancelJob(*worker.job, number);
        worker.job.reset();
        worker.isLeaving = true;
        endWorker(number, worker, QStringLiteral("the scan was cancelled"));
    }
}

/// A user waits for none of these any more.
void ProbePool::skipJobs()
{
    for (auto &[number, worker] : m_workers) {
        if (!worker.job || worker.isLeaving || !listenerOf(*worker.job).isSkipped(m_jobs[*worker.job].place))
            continue;
        ProbeOutcome skipped = ProbeOutcome::skipped();
        skipped.stage = worker.outcome.stage;
        skipped.milliseconds = worker.millisecondsOfJob();
        const std::size_t job = *worker.job;
        worker.job.reset();
        worker.isLeaving = true;
        endWorker(number, worker, QStringLiteral("its plug-in was skipped"));
        endJob(job, number, skipped);
    }
}

/// Looks at the files that come next, in this process and while workers are busy.
void ProbePool::lookAhead()
{
    const std::size_t ahead = 2 * static_cast<std::size_t>(m_settings.workers);
    for (std::size_t place = 0; place < std::min(ahead, m_waiting.size());) {
        Waiting &waiting = m_waiting[place];
        const std::size_t job = waiting.job;
        const std::optional<ProbeOutcome> seen =
            waiting.isLookedAt ? std::nullopt : listenerOf(job).look(m_jobs[job].place);
        waiting.isLookedAt = true;
        if (!seen) {
            ++place;
            continue;
        }
        m_waiting.erase(m_waiting.begin() + static_cast<std::ptrdiff_t>(place));
        endJob(job, 0, *seen);
    }
}

/// As many as there are jobs for, ahead of time: a worker that is being replaced costs its start otherwise.
void ProbePool::startWorkers()
{
    const auto count = [this](auto &&has) {
        return static_cast<std::size_t>(std::count_if(m_workers.begin(), m_workers.end(),
                                                      [&](const auto &entry) { return has(entry.second); }));
    };
    const std::size_t busy = count([](const PoolWorker &worker) { return worker.job.has_value(); });
    const std::size_t wanted =
        std::min(static_cast<std::size_t>(m_settings.workers), m_waiting.size() + busy);
    while (count([](const PoolWorker &worker) { return !worker.isLeaving; }) < wanted &&
           m_failedStarts < kMaxFailedStarts) {
        QString reason;
        const std::optional<int> number = m_group.start(reason);
        if (!number) {
            ++m_failedStarts;
            DebugLog(L"A worker could not be started: %ls", reason);
            continue;
        }
        m_workers[*number].silent.start();
    }
}

/// False when the system gives no worker and none is left.
bool ProbePool::hasWorkers() const
{
    return m_failedStarts < kMaxFailedStarts ||
           std::any_of(m_workers.begin(), m_workers.end(), [](const auto &entry) {
               return entry.second.job || (entry.second.isReady && !entry.second.isLeaving);
           });
}

/// The place of the job that a worker gets; past the end when none fits it.
std::size_t ProbePool::nextFor(const PoolWorker &worker) const
{
    // One that needs a fresh worker gets the next fresh one, and those that are to be alone come first.
    const bool isFresh = worker.probed == 0;
    const auto fits = [isFresh](const Waiting &waiting) { return isFresh || !waiting.needsFreshWorker; };
    const bool isAlone = m_jobs[m_waiting.front().job].what.isAlone;
    const auto end = isAlone ? m_waiting.begin() + 1 : m_waiting.end();
    const auto next = std::find_if(m_waiting.begin(), end, fits);
    return next == end ? m_waiting.size() : static_cast<std::size_t>(next - m_waiting.begin());
}

void ProbePool::handOut()
{
    for (auto &[number, worker] : m_workers) {
        const auto isAlone = [this](const auto &entry) {
            return entry.second.job && m_jobs[*entry.second.job].what.isAlone;
        };
        if (m_waiting.empty() || (m_jobs[m_waiting.front().job].what.isAlone && isBusy()) ||
            std::any_of(m_workers.begin(), m_workers.end(), isAlone))
            return;
        if (!worker.isReady || worker.job || worker.isLeaving)
            continue;
        const std::size_t next = nextFor(worker);
        if (next < m_waiting.size()) {
            handOut(number, worker, next);
        } else {
            worker.isLeaving = true;
            endWorker(number, worker, QStringLiteral("a fresh one takes its place"));
        }
    }
}

void ProbePool::handOut(int number, PoolWorker &worker, std::size_t index)
{
    const std::size_t job = m_waiting[index].job;
    m_waiting.erase(m_waiting.begin() + static_cast<std::ptrdiff_t>(index));
    worker.begin(job, jobOf(job).path);
    listenerOf(job).jobBegins(m_jobs[job].place, number);
    ChannelMessage message;
    message.kind = ChannelMessage::Kind::Job;
    message.job = jobOf(job);
    m_group.send(number,
                 encodeMessage(message)); // one that takes nothing has ended, which is told by an event
}

void ProbePool::take(const WorkerEvent &event)
{
    if (event.end) {
        takeEnd(event.worker, *event.end);
        return;
    }
    const auto found = m_workers.find(event.worker);
    if (found == m_workers.end() || found->second.isLeaving)
        return;
    PoolWorker &worker = found->second;
    worker.reader.feed(event.data);
    while (const std::optional<ChannelMessage> message = worker.reader.next())
        takeMessage(event.worker, worker, *message);
    if (worker.isGarbled() && worker.endedFor.isEmpty())
        endWorker(event.worker, worker, QStringLiteral("it wrote into the channel of its worker"));
}

void ProbePool::takeMessage(int number, PoolWorker &worker, const ChannelMessage &message)
{
    using Kind = ChannelMessage::Kind;
    if (message.kind == Kind::Ready) {
        worker.isReady = true;
        worker.freshMemory = m_group.use(number).memory;
        m_failedStarts = 0;
        return;
    }
    if (!worker.job || worker.isGarbled() || !worker.note(message))
        return; // a plug-in speaks in its worker's name
    IPoolListener &listener = listenerOf(*worker.job);
    const std::size_t place = m_jobs[*worker.job].place;
    switch (message.kind) {
    case Kind::Stage:
        listener.stageEntered(place, number, message.stage);
        break;
    case Kind::Class:
        listener.classBegins(place, number, message.text);
        break;
    case Kind::Announced:
        listener.classAnnounced();
        break;
    case Kind::Child:
        listener.childBegins(place, number, message.record);
        break;
    case Kind::ChildEnd: {
        ProbeOutcome ended = message.outcome;
        ended.records.push_back(message.record);
        listener.childEnds(place, number, ended);
        break;
    }
    case Kind::Done: {
        ProbeOutcome outcome = message.outcome;
        outcome.records = std::move(worker.outcome.records);
        finishJob(number, worker, outcome);
        break;
    }
    case Kind::Ready:
    case Kind::Job:
    case Kind::Children:
    case Kind::ChildCloses:
    case Kind::ChildClosed:
    case Kind::Record:
        break;
    }
}

void ProbePool::endWorker(int number, PoolWorker &worker, const QString &reason)
{
    worker.endedFor = reason;
    m_group.end(number);
}

void ProbePool::finishJob(int number, PoolWorker &worker, const ProbeOutcome &outcome)
{
    const std::size_t job = *worker.job;
    worker.end();
    if (const QString why = worker.whySpent(outcome, m_group.use(number)); !why.isEmpty()) {
        worker.isLeaving = true;
        endWorker(number, worker, why);
    }
    endJob(job, number, outcome);
}

/// What a worker was busy with when it ended is to blame, if it asked nobody before.
void ProbePool::takeEnd(int number, const WorkerEnd &end)
{
    const auto found = m_workers.find(number);
    if (found == m_workers.end())
        return;
    const PoolWorker worker = std::move(found->second);
    m_workers.erase(found);
    if (!worker.isReady && !worker.isLeaving) {
        ++m_failedStarts;
        DebugLog(L"A worker ended at its start: %ls", worker.whyEnded(end, m_group.output(number)).summary);
    }
    if (!worker.job) {
        if (!worker.isLeaving)
            DebugLog(L"A worker ended after it had asked %ls", namesOf(worker.probedPaths));
        m_listener->workerEnds(number, worker.isLeaving
                                           ? worker.endedFor
                                           : worker.whyEnded(end, m_group.output(number)).summary);
        return;
    }
    const std::size_t job = *worker.job;
    const CrashReport report = worker.whyEnded(end, m_group.output(number));
    const QString &reason = report.summary;
    const bool isKilled = end.isKilled && worker.endedFor.isEmpty(); // by whoever needed memory, or a user
    if (m_isCancelled)
        cancelJob(job, number);
    else if (worker.probed != 0 || (isKilled && m_killed.insert(job).second))
        askAgain(job, reason, worker);
    else
        giveVerdict(job, number, worker, report);
    m_listener->workerEnds(number, reason);
}

/// Somebody who went before may be to blame.
void ProbePool::askAgain(std::size_t job, const QString &reason, const PoolWorker &worker)
{
    DebugLog(L"%ls: %ls; it is asked again in a fresh worker, as before it went %ls", jobOf(job).path, reason,
             namesOf(worker.probedPaths));
    m_waiting.push_front({job, true, true});
}

void ProbePool::cancelJob(std::size_t job, int number)
{
    ProbeOutcome cancelled;
    cancelled.status = ProbeStatus::Cancelled;
    endJob(job, number, cancelled);
}

void ProbePool::giveVerdict(std::size_t job, int number, const PoolWorker &worker, const CrashReport &report)
{
    ProbeOutcome outcome;
    outcome.status = worker.isOverdue ? ProbeStatus::NoAnswer : ProbeStatus::Crashed;
    outcome.stage = worker.outcome.stage;
    outcome.reason = report.summary;
    outcome.frames = report.frames;
    outcome.milliseconds = worker.millisecondsOfJob();
    if (worker.child && jobOf(job).leftOut.insert(worker.child->subId).second) {
        // One sub-plug-in's crash is not its shell's: the others are asked without it.
        outcome.records.push_back(*worker.child);
        outcome.records.back().enabled = outcome.records.back().working = false;
        m_crashedChildren[job].push_back(outcome.records.back());
        listenerOf(job).childEnds(m_jobs[job].place, number, outcome);
        m_waiting.push_front({job, true, true});
        return;
    }
    outcome.records = m_crashedChildren[job];
    endJob(job, number, outcome);
}

void ProbePool::endOverdue()
{
    for (auto &[number, worker] : m_workers) {
        if (!worker.isReady && worker.endedFor.isEmpty() && worker.silent.hasExpired(kStartPatience))
            endWorker(number, worker, QStringLiteral("it did not begin to work"));
        const bool isOverdue = worker.job && m_settings.limit.count() > 0 && worker.endedFor.isEmpty() &&
                               worker.silent.hasExpired(m_settings.limit.count());
        if (!isOverdue)
            continue;
        worker.isOverdue = true;
        endWorker(number, worker,
                  QStringLiteral("it gave no answer for %1 s").arg(m_settings.limit.count() / 1000));
    }
}

/// Ends workers that take too much, by themselves or in processes that they started.
void ProbePool::endExcessive()
{
    constexpr qint64 kPause = 100; // ms
    if (m_sinceUse.isValid() && !m_sinceUse.hasExpired(kPause))
        return;
    m_sinceUse.start();
    for (auto &[number, worker] : m_workers) {
        if (!worker.job || !worker.endedFor.isEmpty())
            continue;
        const QString excess = PoolWorker::excessOf(m_group.use(number), m_settings.memoryLimit);
        if (!excess.isEmpty())
            endWorker(number, worker, excess);
    }
}
