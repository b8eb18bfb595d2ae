#include "Core/BaseLib/Process/ThreadCount.h"

#include <QFile>

#include <cerrno>
#include <csignal>
#include <cstdlib>

#include <dirent.h>

std::set<int> runningThreads()
{
    std::set<int> threads;
    DIR *tasks = opendir("/proc/self/task"); // one entry per thread (proc(5))
    if (!tasks)
        return threads;
    while (const dirent *entry = readdir(tasks))
        if (entry->d_name[0] != '.')
            threads.insert(static_cast<int>(std::strtol(entry->d_name, nullptr, 10)));
    closedir(tasks);
    return threads;
}

namespace {

/// Whether a process has ended and only waits for whoever started it to ask how.
bool isZombie(qint64 process)
{
    QFile file(QStringLiteral("/proc/%1/stat").arg(process));
    if (!file.open(QIODevice::ReadOnly))
        return false;
    const QByteArray stat = file.readAll();
    return stat.mid(stat.lastIndexOf(')') + 1).trimmed().startsWith('Z'); // a name may hold anything
}

} // namespace

bool isProcessRunning(qint64 process)
{
    return process > 0 && (kill(static_cast<pid_t>(process), 0) == 0 || errno == EPERM) && !isZombie(process);
}
