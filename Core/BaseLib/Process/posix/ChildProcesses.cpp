#include "Core/BaseLib/Process/posix/ChildProcesses.h"

#include "Core/BaseLib/Process/WorkerGroup.h"

#include <QDir>
#include <QFile>

#include <csignal>

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
