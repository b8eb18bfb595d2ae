#include "Tests/Support/ChildProcess.h"

#include <gtest/gtest.h>

#include <windows.h>

namespace {

/// Puts this process into a job that ends its members when its last handle goes. Children are born into it.
bool enterJob()
{
    JOBOBJECT_EXTENDED_LIMIT_INFORMATION limits = {};
    limits.BasicLimitInformation.LimitFlags = JOB_OBJECT_LIMIT_KILL_ON_JOB_CLOSE;
    const HANDLE job = CreateJobObjectW(nullptr, nullptr);
    return SetInformationJobObject(job, JobObjectExtendedLimitInformation, &limits, sizeof limits) &&
           AssignProcessToJobObject(job, GetCurrentProcess());
}

/// Tells a window what it hears when the user's session ends.
BOOL CALLBACK endSession(HWND window, LPARAM wanted)
{
    DWORD process = 0;
    GetWindowThreadProcessId(window, &process);
    if (process != static_cast<DWORD>(wanted))
        return TRUE;
    DWORD_PTR agreed = 0;
    if (SendMessageTimeoutW(window, WM_QUERYENDSESSION, 0, 0, SMTO_NORMAL, 1000, &agreed))
        PostMessageW(window, WM_ENDSESSION, static_cast<WPARAM>(agreed), 0);
    return TRUE;
}

} // namespace

ChildProcess::ChildProcess()
{
    static const bool inJob = enterJob();
    EXPECT_TRUE(inJob) << "error " << GetLastError();
}

void ChildProcess::setupChildProcess() {}

void requestTermination(QProcess &process)
{
    EnumWindows(endSession, static_cast<LPARAM>(process.processId()));
}

int endingSignal(const QProcess &) { return 0; }
