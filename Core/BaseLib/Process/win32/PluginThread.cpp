#include "Core/BaseLib/Process/PluginThread.h"

#include "Core/BaseLib/Process/FaultGuard.h"
#include "Core/BaseLib/Process/ProcessSetup.h"

#include <windows.h>

#include <mmsystem.h>
#include <objbase.h>
#include <pthread.h>

namespace {
/// A window that is never painted keeps asking to be.
constexpr int kMostMessages = 1000;
constexpr UINT kTimerPeriod = 60000; ///< ms, near the longest

/// What whoever started the thread gets to notice that it has ended.
constexpr DWORD kGrace = 3000; // ms

void CALLBACK doNothing(UINT, UINT, DWORD_PTR, DWORD_PTR, DWORD_PTR) {}

/// Ends the process some time after a thread, unless that leaves as it should. Calls nothing that waits for
/// the loader.
void watch(HANDLE thread, HANDLE leaves)
{
    const HANDLE both[] = {leaves, thread};
    const bool hasLeft = WaitForMultipleObjects(2, both, FALSE, INFINITE) == WAIT_OBJECT_0;
    if (!hasLeft && WaitForSingleObject(leaves, kGrace) == WAIT_TIMEOUT)
        leaveProcess(0);
    CloseHandle(thread);
    CloseHandle(leaves);
}

/// A handle of the same object, for another thread.
HANDLE duplicate(HANDLE handle)
{
    HANDLE copy = nullptr;
    const HANDLE process = GetCurrentProcess();
    DuplicateHandle(process, handle, process, &copy, 0, FALSE, DUPLICATE_SAME_ACCESS);
    return copy;
}
} // namespace

PluginThread::PluginThread()
    : m_prepared(SUCCEEDED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)))
    // Starts the system's timer thread now. Qt would have it started and ended whenever it draws the window;
    // a thread that starts during a probe would be taken for the plug-in's.
    , m_timer(timeSetEvent(kTimerPeriod, kTimerPeriod, doNothing, 0, TIME_PERIODIC))
    , m_leaves(CreateEventW(nullptr, TRUE, FALSE, nullptr))
{
    // Makes room on this stack for handling its overflow before the first module is loaded, which is not
    // guarded.
    callGuarded([] {});
    std::thread(watch, duplicate(GetCurrentThread()), duplicate(m_leaves)).detach();
}

PluginThread::~PluginThread()
{
    SetEvent(m_leaves);
    CloseHandle(m_leaves);
    timeKillEvent(m_timer);
    if (m_prepared)
        CoUninitialize();
}

void PluginThread::deliverMessages()
{
    MSG message;
    for (int count = 0; count < kMostMessages; ++count) {
        if (!PeekMessageW(&message, nullptr, 0, 0, PM_REMOVE))
            return;
        TranslateMessage(&message);
        DispatchMessageW(&message);
    }
}

bool PluginThread::hasEndedAlone(std::thread &thread)
{
    if (!thread.joinable())
        return false;
    auto *handle = static_cast<HANDLE>(pthread_gethandle(thread.native_handle()));
    return WaitForSingleObject(handle, 0) == WAIT_OBJECT_0;
}
