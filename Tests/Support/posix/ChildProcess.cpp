#include "Tests/Support/ChildProcess.h"

#include <QDir>
#include <QFile>

#include <csignal>

#include <sys/prctl.h>
#include <unistd.h>

ChildProcess::ChildProcess() = default;

void ChildProcess::setupChildProcess()
{
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    setpgid(0, 0); // some plug-ins kill the group of whoever started them
}

std::vector<qint64> childrenOf(qint64 process)
{
    std::vector<qint64> children;
    const QDir tasks(QStringLiteral("/proc/%1/task").arg(process));
    for (const QString &task : tasks.entryList(QDir::Dirs | QDir::NoDotAndDotDot)) {
        QFile file(tasks.filePath(task + "/children"));
        if (file.open(QIODevice::ReadOnly))
            for (const QByteArray &child : file.readAll().simplified().split(' '))
                if (!child.isEmpty())
                    children.push_back(child.toLongLong());
    }
    return children;
}

const std::vector<TerminationWay> &terminationWays()
{
    static const std::vector<TerminationWay> ways = {
        {"SIGTERM", SIGTERM}, {"SIGINT", SIGINT}, {"SIGHUP", SIGHUP}};
    return ways;
}

void requestTermination(QProcess &process, const TerminationWay &way)
{
    if (process.processId() > 0) // 0, of one that has ended, stands for our own group
        ::kill(static_cast<pid_t>(process.processId()), way.number);
}
