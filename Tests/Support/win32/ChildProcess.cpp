#include "Tests/Support/ChildProcess.h"

#include <gtest/gtest.h>

#include <windows.h>

#include <tlhelp32.h>

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

struct Request {
    DWORD process;
    UINT message;
};

/// Tells a window what it hears when the user's session ends, or when somebody asks the program to close.
BOOL CALLBACK tellWindow(HWND window, LPARAM given)
{
    const auto &request = *reinterpret_cast<const Request *>(given);
    DWORD process = 0;
    GetWindowThreadProcessId(window, &process);
    if (process != request.process)
        return TRUE;
    DWORD_PTR agreed = 0;
    if (request.message != WM_ENDSESSION)
        PostMessageW(window, request.message, 0, 0);
    else if (SendMessageTimeoutW(window, WM_QUERYENDSESSION, 0, 0, SMTO_NORMAL, 1000, &agreed))
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

std::vector<qint64> childrenOf(qint64 process)
{
    std::vector<qint64> children;
    PROCESSENTRY32W entry = {};
    entry.dwSize = sizeof entry;
    const HANDLE all = CreateToolhelp32Snapshot(TH32CS_SNAPPROCESS, 0);
    for (bool isThere = Process32FirstW(all, &entry); isThere; isThere = Process32NextW(all, &entry))
        if (entry.th32ParentProcessID == process)
            children.push_back(entry.th32ProcessID);
    CloseHandle(all);
    return children;
}

const std::vector<TerminationWay> &terminationWays()
{
    static const std::vector<TerminationWay> ways = {{"EndOfSession", WM_ENDSESSION}, {"Close", WM_CLOSE}};
    return ways;
}

void requestTermination(QProcess &process, const TerminationWay &way)
{
    Request request = {static_cast<DWORD>(process.processId()), static_cast<UINT>(way.number)};
    EnumWindows(tellWindow, reinterpret_cast<LPARAM>(&request));
}
