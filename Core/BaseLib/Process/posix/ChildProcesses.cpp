#include "Core/BaseLib/Process/posix/ChildProcesses.h"

#include "Core/BaseLib/Process/WorkerGroup.h"

#include <QDeadlineTimer>
#include <QDir>
#include <QFile>

#include <csignal>
#include <iterator>
#include <numeric>
#include <vector>

#include <unistd.h>

namespace {

/// Resident memory of a process in bytes, with what it shares with others divided among them.
qint64 shareOfMemory(pid_t process)
{
    QFile file(QStringLiteral("/proc/%1/smaps_rollup").arg(process));
    if (!file.open(QIODevice::ReadOnly))
        return 0;
    for (const QByteArray &line : file.readAll().split('\n'))
        if (line.startsWith("Pss:"))
            return line.simplified().split(' ').value(1).toLongLong() * 1024; // told in kB
    return 0;
}

} // namespace

std::set<pid_t> childrenOf(pid_t process)
{
    std::set<pid_t> children;
    const QDir tasks(QStringLiteral("/proc/%1/task").arg(process));
    for (const QString &task : tasks.entryList(QDir::Dirs | QDir::NoDotAndDotDot)) {
        QFile file(tasks.filePath(task + QLatin1String("/children")));
        if (!file.open(QIODevice::ReadOnly))
            continue;
        for (const QByteArray &child : file.readAll().split(' '))
            if (const int number = child.trimmed().toInt(); number > 0)
                children.insert(number);
    }
    return children;
}

void keepEndedChildren()
{
    struct sigaction action = {};
    if (sigaction(SIGCHLD, nullptr, &action) == 0 &&
        (action.sa_handler == SIG_IGN || (action.sa_flags & SA_NOCLDWAIT) != 0)) {
        action = {};
        action.sa_handler = SIG_DFL;
        sigaction(SIGCHLD, &action, nullptr);
    }
}

int workerOf(pid_t process)
{
    QFile file(QStringLiteral("/proc/%1/environ").arg(process));
    if (!file.open(QIODevice::ReadOnly))
        return 0;
    const QByteArray mark = QByteArray(WorkerChannel::kVariable) + '=';
    for (const QByteArray &entry : file.readAll().split('\0'))
        if (entry.startsWith(mark))
            return entry.mid(mark.size()).toInt();
    return 0;
}

std::set<pid_t> withDescendants(const std::set<pid_t> &processes)
{
    constexpr std::size_t kMost = 300;
    std::set<pid_t> all = processes;
    std::vector<pid_t> unseen(processes.begin(), processes.end());
    while (!unseen.empty() && all.size() < kMost) {
        const pid_t next = unseen.back();
        unseen.pop_back();
        for (const pid_t child : childrenOf(next))
            if (all.insert(child).second)
                unseen.push_back(child);
    }
    return all;
}

qint64 residentMemoryOf(pid_t process)
{
    QFile file(QStringLiteral("/proc/%1/statm").arg(process));
    const QList<QByteArray> pages =
        file.open(QIODevice::ReadOnly) ? file.readAll().split(' ') : QList<QByteArray>();
    return pages.size() > 1 ? pages.at(1).toLongLong() * sysconf(_SC_PAGESIZE) : 0;
}

qint64 SharedMemory::of(const std::set<pid_t> &processes)
{
    const QDeadlineTimer deadline(std::chrono::milliseconds(5));
    for (auto share = m_shares.begin(); share != m_shares.end();)
        share = processes.count(share->first) == 0 ? m_shares.erase(share) : std::next(share);
    auto next = processes.upper_bound(m_last); // those whose turn was longest ago
    for (std::size_t count = 0; count < processes.size() && !deadline.hasExpired(); ++count, ++next) {
        if (next == processes.end())
            next = processes.begin();
        m_shares[*next] = shareOfMemory(*next);
        m_last = *next;
    }
    return std::accumulate(m_shares.begin(), m_shares.end(), qint64(0),
                           [](qint64 sum, const auto &share) { return sum + share.second; });
}
