#include "Core/BaseLib/PluginThread.h"

#include <objbase.h>
#include <pthread.h>

namespace {
/// A window that is never painted asks for it without end.
constexpr int kMostMessages = 1000;
} // namespace

PluginThread::PluginThread()
    : m_prepared(SUCCEEDED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)))
{}

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
