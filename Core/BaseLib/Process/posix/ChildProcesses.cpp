#include "Core/BaseLib/Process/posix/ChildProcesses.h"

#include "Core/BaseLib/Process/WorkerGroup.h"

#include <QDir>
#include <QFile>

#include <csignal>

std::set<pid_t> childrenOfThisProcess()
{
    std::set<pid_t> children;
    for (const QString &task :
         QDir(QStringLiteral("/proc/self/task")).entryList(QDir::Dirs | QDir::NoDotAndDotDot)) {
        QFile file(QStringLiteral("/proc/self/task/%1/children").arg(task));
        if (!file.open(QIODevice::ReadOnly))
            continue;
        for (const QByteArray &child : file.readAll().split(' '))
            if (const int process = child.trimmed().toInt(); process > 0)
                children.insert(process);
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
