#include "Core/BaseLib/Process/PluginThread.h"

#include "Core/BaseLib/Process/FaultGuard.h"

#include <windows.h>

#include <mmsystem.h>
#include <objbase.h>
#include <pthread.h>

namespace {
/// A window that is never painted keeps asking to be.
constexpr int kMostMessages = 1000;
constexpr UINT kTimerPeriod = 60000; ///< ms, near the longest

void CALLBACK doNothing(UINT, UINT, DWORD_PTR, DWORD_PTR, DWORD_PTR) {}
} // namespace

PluginThread::PluginThread()
    : m_prepared(SUCCEEDED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)))
    // Starts the system's timer thread now. Qt would have it started and ended whenever it draws the window;
    // a thread that starts during a probe would be taken for the plug-in's.
    , m_timer(timeSetEvent(kTimerPeriod, kTimerPeriod, doNothing, 0, TIME_PERIODIC))
{
    // Makes room on this stack for handling its overflow before the first module is loaded, which is not
    // guarded.
    callGuarded([] {});
}

PluginThread::~PluginThread()
{
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
