#include "Main/AudioEngineController/Effects/Host/PoolWorker.h"

#include "Core/BaseLib/Log/DebugLog.h"

namespace {

/// A worker that holds so much more memory than a fresh one is replaced.
constexpr qint64 kMaxGrowth = 256 << 20; // bytes
/// So many modules are asked in one worker: what they leave in the process adds up.
constexpr int kMaxModules = 50;
/// A plug-in that starts more processes does so without end; one that shows pages of the web starts ten.
constexpr int kMaxChildren = 200;
/// Far more than the largest shell or module has to tell.
constexpr int kMaxMessages = 1 << 20;
/// Classes of a module that are asked for, and more than children.
constexpr std::size_t kMaxRecords = 1 << 16;
constexpr int kLastLines = 3; ///< of what a worker printed, in the reason

} // namespace

void PoolWorker::begin(std::size_t newJob, const QString &newPath)
{
    job = newJob;
    path = newPath;
    outcome = ProbeOutcome();
    child.reset();
    m_messages = 0;
    silent.start();
    sinceJob.start();
}

void PoolWorker::end()
{
    job.reset();
    child.reset();
    ++probed;
    probedPaths.append(path);
}

bool PoolWorker::note(const ChannelMessage &message)
{
    using Kind = ChannelMessage::Kind;
    m_isGarbled |= ++m_messages > kMaxMessages || !isBelievable(message);
    if (m_isGarbled)
        return false;
    silent.start();
    if (message.kind == Kind::Stage)
        outcome.stage = message.stage;
    else if (message.kind == Kind::Child || message.kind == Kind::ChildCloses)
        child = message.record;
    else if (message.kind == Kind::ChildEnd || message.kind == Kind::ChildClosed)
        child.reset();
    else if (message.kind == Kind::Record)
        outcome.records.push_back(message.record);
    return true;
}

bool PoolWorker::isBelievable(const ChannelMessage &message) const
{
    using Kind = ChannelMessage::Kind;
    const bool isOver = message.outcome.status == ProbeStatus::Listed ||
                        message.outcome.status == ProbeStatus::Failed ||
                        message.outcome.status == ProbeStatus::NoPlugin;
    if (message.kind == Kind::Done || message.kind == Kind::ChildEnd)
        return isOver;
    const bool hasRecord =
        message.kind == Kind::Record || message.kind == Kind::Child || message.kind == Kind::ChildCloses;
    return !hasRecord || (message.record.path == path && outcome.records.size() < kMaxRecords);
}

QString PoolWorker::excessOf(const WorkerUse &use, qint64 memoryLimit)
{
    if (memoryLimit > 0 && use.memory > memoryLimit)
        return QStringLiteral("it took more than %1 MiB of memory").arg(memoryLimit >> 20);
    if (use.children > kMaxChildren)
        return QStringLiteral("it started more than %1 processes").arg(kMaxChildren);
    return QString();
}

QString PoolWorker::whySpent(const ProbeOutcome &last, const WorkerUse &use) const
{
    if (last.faulted)
        return QStringLiteral("a plug-in crashed in it");
    if (last.leftThreads)
        return QStringLiteral("a plug-in left threads in it");
    if (last.leftModule)
        return QStringLiteral("a plug-in stayed in it");
    if (use.children > 0)
        return QStringLiteral("a plug-in left processes in it");
    if (use.memory - freshMemory > kMaxGrowth)
        return QStringLiteral("it holds too much memory");
    if (probed >= kMaxModules)
        return QStringLiteral("it asked %1 plug-ins").arg(probed);
    return QString();
}

CrashReport PoolWorker::whyEnded(const WorkerEnd &how, QString printed) const
{
    const QString when = job ? QLatin1String(duringStage(outcome.stage)) : QLatin1String();
    const CrashReport crash = CrashReport::take(printed);
    if (job && !crash.frames.isEmpty())
        DebugLog(L"%ls crashed at %ls", path, crash.frames.join(QStringLiteral(" < ")));
    QString text = endedFor + when;
    if (endedFor.isEmpty() && !crash.summary.isEmpty())
        text = QStringLiteral("it crashed%1 (%2)").arg(when, crash.summary);
    else if (endedFor.isEmpty() && how.crashed)
        text = QStringLiteral("it crashed%1 (%2)").arg(when, how.text);
    else if (endedFor.isEmpty() && how.code == kChannelLost)
        text = QStringLiteral("it closed the channel of its worker") + when;
    else if (endedFor.isEmpty())
        text = QStringLiteral("it ended its process with exit code %1%2").arg(how.code).arg(when);
    const QStringList lines = printed.split(QLatin1Char('\n'), Qt::SkipEmptyParts).mid(-kLastLines);
    if (!lines.isEmpty())
        text += QStringLiteral("; it printed: ") + lines.join(QStringLiteral(" / "));
    return {text, crash.frames};
}
