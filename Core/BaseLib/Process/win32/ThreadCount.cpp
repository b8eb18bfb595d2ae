#include "Core/BaseLib/Process/ThreadCount.h"

#include "Core/BaseLib/Files/win32/WindowsHandle.h"

#include <algorithm>
#include <iterator>

#include <tlhelp32.h>
#include <winternl.h>

namespace {

constexpr auto kStartAddress = static_cast<THREADINFOCLASS>(9); // ThreadQuerySetWin32StartAddress

HMODULE moduleAt(const void *address)
{
    HMODULE module = nullptr;
    GetModuleHandleExW(GET_MODULE_HANDLE_EX_FLAG_FROM_ADDRESS | GET_MODULE_HANDLE_EX_FLAG_UNCHANGED_REFCOUNT,
                       static_cast<const wchar_t *>(address), &module);
    return module;
}

/// The libraries whose threads the system runs for itself: some load libraries for the loader, some wait for
/// COM calls. They start when a plug-in first needs one, and then wait minutes for more work.
constexpr const wchar_t *kSystemWorkers[] = {L"ntdll.dll", L"rpcrt4.dll", L"combase.dll", L"ole32.dll"};

bool isTheSystems(DWORD id)
{
    const WindowsHandle thread(OpenThread(THREAD_QUERY_INFORMATION, FALSE, id));
    const void *start = nullptr;
    if (!thread.isValid() ||
        NtQueryInformationThread(thread.get(), kStartAddress, &start, sizeof start, nullptr) < 0)
        return false;
    const HMODULE module = moduleAt(start);
    return module && std::any_of(std::begin(kSystemWorkers), std::end(kSystemWorkers),
                                 [&](const wchar_t *name) { return GetModuleHandleW(name) == module; });
}

} // namespace

std::set<int> runningThreads()
{
    std::set<int> threads;
    const WindowsHandle snapshot(CreateToolhelp32Snapshot(TH32CS_SNAPTHREAD, 0));
    const DWORD process = GetCurrentProcessId();
    THREADENTRY32 entry = {};
    entry.dwSize = sizeof entry;
    if (!snapshot.isValid() || !Thread32First(snapshot.get(), &entry))
        return threads;
    do {
        if (entry.th32OwnerProcessID == process && !isTheSystems(entry.th32ThreadID))
            threads.insert(static_cast<int>(entry.th32ThreadID));
    } while (Thread32Next(snapshot.get(), &entry));
    return threads;
}

bool isProcessRunning(qint64 process)
{
    const WindowsHandle found(OpenProcess(SYNCHRONIZE, FALSE, static_cast<DWORD>(process)));
    if (!found.isValid())
        return GetLastError() == ERROR_ACCESS_DENIED;
    return WaitForSingleObject(found.get(), 0) == WAIT_TIMEOUT; // it may be held open after its end
}
