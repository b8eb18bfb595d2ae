#include "Core/BaseLib/Process/ProcessSetup.h"

#include <array>
#include <clocale>
#include <cstdio>
#include <cstdlib>

#include <fcntl.h>
#include <io.h>
#include <windows.h>

namespace {

/// The code page that the joined console had before; 0 without a console.
UINT consoleCodePage = 0;

void keepQuiet(const wchar_t *, const wchar_t *, const wchar_t *, unsigned, uintptr_t) {}

/// A crash ends the process without a box, and so do the run-time library's own checks.
void suppressErrorBoxes()
{
    const UINT before = SetErrorMode(SEM_NOGPFAULTERRORBOX);
    SetErrorMode(before | SEM_NOGPFAULTERRORBOX);
    _set_error_mode(_OUT_TO_STDERR);
    _set_invalid_parameter_handler(keepQuiet);
}

bool leadsSomewhere(DWORD standardHandle)
{
    const HANDLE handle = GetStdHandle(standardHandle);
    return handle && handle != INVALID_HANDLE_VALUE && GetFileType(handle) != FILE_TYPE_UNKNOWN;
}

/// A program with windows gets no console of its own, but may join that of the shell that started it. What
/// the shell redirected to a file or a pipe stays so.
void joinConsole()
{
    const bool hasOutput = leadsSomewhere(STD_OUTPUT_HANDLE);
    const bool hasErrors = leadsSomewhere(STD_ERROR_HANDLE);
    if ((hasOutput && hasErrors) || !AttachConsole(ATTACH_PARENT_PROCESS))
        return;
    if (!hasOutput)
        std::freopen("CONOUT$", "w", stdout);
    if (!hasErrors)
        std::freopen("CONOUT$", "w", stderr);
    consoleCodePage = GetConsoleOutputCP();
    SetConsoleOutputCP(CP_UTF8);
}

} // namespace

void prepareProcess()
{
    suppressErrorBoxes();
    joinConsole();
}

void settleLocale() { std::setlocale(LC_NUMERIC, "C"); }

qint64 machineMemory()
{
    MEMORYSTATUSEX memory = {};
    memory.dwLength = sizeof memory;
    return GlobalMemoryStatusEx(&memory) ? static_cast<qint64>(memory.ullTotalPhys) : 0;
}

void leaveProcess(int exitCode)
{
    if (consoleCodePage != 0)
        SetConsoleOutputCP(consoleCodePage);
    // Neither ExitProcess, which detaches every module, nor exit: nothing of ours is left to flush.
    TerminateProcess(GetCurrentProcess(), static_cast<UINT>(exitCode));
    std::abort();
}
