#include "Tests/Support/ChildProcess.h"

#include <csignal>

#include <sys/prctl.h>

ChildProcess::ChildProcess() = default;

void ChildProcess::setupChildProcess() { prctl(PR_SET_PDEATHSIG, SIGKILL); }

void requestTermination(QProcess &process) { process.terminate(); }

// NOTE: Qt documents no value for a crashed process; on these platforms Qt 5 puts the signal there.
int endingSignal(const QProcess &process)
{
    return process.exitStatus() == QProcess::CrashExit ? process.exitCode() : 0;
}
