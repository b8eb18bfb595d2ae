#include "Core/BaseLib/ThreadCount.h"

#include <windows.h>

#include <tlhelp32.h>
#include <winternl.h>

namespace {

constexpr auto kStartAddress = static_cast<THREADINFOCLASS>(9); // ThreadQuerySetWin32StartAddress

/// Closes a handle at the end of a scope.
class Handle {
public:
    explicit Handle(HANDLE handle)
        : m_handle(handle)
    {}
    ~Handle()
    {
        if (isValid())
            CloseHandle(m_handle);
    }
    Handle(const Handle &) = delete;
    Handle &operator=(const Handle &) = delete;

    bool isValid() const { return m_handle && m_handle != INVALID_HANDLE_VALUE; }
    HANDLE get() const { return m_handle; }

private:
    HANDLE m_handle;
};

HMODULE moduleAt(const void *address)
{
    HMODULE module = nullptr;
    GetModuleHandleExW(GET_MODULE_HANDLE_EX_FLAG_FROM_ADDRESS | GET_MODULE_HANDLE_EX_FLAG_UNCHANGED_REFCOUNT,
                       static_cast<const wchar_t *>(address), &module);
    return module;
}

/// Whether a thread belongs to the system's own pool. The loader itself employs it to load libraries, and its
/// threads wait for minutes for more work.
bool isOfThreadPool(DWORD id)
{
    const Handle thread(OpenThread(THREAD_QUERY_INFORMATION, FALSE, id));
    const void *start = nullptr;
    return thread.isValid() &&
           NtQueryInformationThread(thread.get(), kStartAddress, &start, sizeof start, nullptr) >= 0 &&
           moduleAt(start) == GetModuleHandleW(L"ntdll.dll");
}

} // namespace

std::set<int> runningThreads()
{
    std::set<int> threads;
    const Handle snapshot(CreateToolhelp32Snapshot(TH32CS_SNAPTHREAD, 0));
    const DWORD process = GetCurrentProcessId();
    THREADENTRY32 entry = {};
    entry.dwSize = sizeof entry;
    if (!snapshot.isValid() || !Thread32First(snapshot.get(), &entry))
        return threads;
    do {
        if (entry.th32OwnerProcessID == process && !isOfThreadPool(entry.th32ThreadID))
            threads.insert(static_cast<int>(entry.th32ThreadID));
    } while (Thread32Next(snapshot.get(), &entry));
    return threads;
}
