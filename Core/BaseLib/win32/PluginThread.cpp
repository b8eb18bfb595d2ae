#include "Core/BaseLib/PluginThread.h"

#include "Core/BaseLib/ProcessSetup.h"

#include <cstdlib>

#include <objbase.h>
#include <pthread.h>

namespace {
/// A window that is never painted asks for it without end.
constexpr int kMostMessages = 1000;

/// For a plug-in that calls exit: it would have our objects destroyed under our other threads, and then wait
/// for modules that wait for those.
void endWithoutExitHandlers() { leaveProcess(EXIT_FAILURE); }
} // namespace

PluginThread::PluginThread()
    : m_prepared(SUCCEEDED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)))
{
    std::atexit(endWithoutExitHandlers);
}

PluginThread::~PluginThread()
{
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
