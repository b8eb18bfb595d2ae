#include "Tests/Support/ChildProcess.h"

#include <csignal>

#include <sys/prctl.h>

ChildProcess::ChildProcess() = default;

void ChildProcess::setupChildProcess() { prctl(PR_SET_PDEATHSIG, SIGKILL); }

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
