#include "Core/BaseLib/Process/TerminationRequest.h"

#include <climits>
#include <cstdlib>
#include <iterator>

#include <windows.h>

namespace {

constexpr DWORD kWindowPatience = 5000; ///< ms; it takes a moment

HANDLE requests()
{
    static const HANDLE semaphore = CreateSemaphoreW(nullptr, 0, LONG_MAX, nullptr);
    return semaphore;
}

/// An answer would end the process at once. The request is never answered instead: the process ends itself
/// when its work is tidied up, and the system waits some seconds for that.
[[noreturn]] void waitForTheEnd()
{
    while (true)
        Sleep(INFINITE);
}

BOOL WINAPI onConsoleEvent(DWORD event)
{
    TerminationSignal::raise();
    if (event != CTRL_C_EVENT && event != CTRL_BREAK_EVENT)
        waitForTheEnd();
    return TRUE;
}

LRESULT CALLBACK onWindowMessage(HWND window, UINT message, WPARAM wParam, LPARAM lParam)
{
    if (message == WM_CLOSE) {
        TerminationSignal::raise();
        return 0;
    }
    if (message == WM_ENDSESSION && wParam) {
        TerminationSignal::raise();
        waitForTheEnd();
    }
    return DefWindowProcW(window, message, wParam, lParam);
}

/// Runs a window, never shown, for what the system sends when the session ends or when the process is asked
/// to close. A message-only window would not receive that.
DWORD WINAPI runWindow(void *created)
{
    WNDCLASSEXW windowClass = {};
    windowClass.cbSize = sizeof windowClass;
    windowClass.lpfnWndProc = onWindowMessage;
    windowClass.hInstance = GetModuleHandleW(nullptr);
    windowClass.lpszClassName = L"FxProbeTermination";
    RegisterClassExW(&windowClass);
    CreateWindowExW(0, windowClass.lpszClassName, L"", WS_OVERLAPPED, 0, 0, 0, 0, nullptr, nullptr,
                    windowClass.hInstance, nullptr);
    SetEvent(created);
    MSG message;
    while (GetMessageW(&message, nullptr, 0, 0) > 0)
        DispatchMessageW(&message);
    return 0;
}

void CALLBACK onParentsEnd(void *, BOOLEAN) { TerminationSignal::raise(); }

void watchParent()
{
    char text[16] = {};
    if (GetEnvironmentVariableA(TerminationSignal::kParentVariable, text,
                                static_cast<DWORD>(std::size(text))) == 0)
        return;
    const HANDLE parent =
        OpenProcess(SYNCHRONIZE, FALSE, static_cast<DWORD>(std::strtoul(text, nullptr, 10)));
    HANDLE wait = nullptr; // lives as long as the process, as the handle does
    if (parent)
        RegisterWaitForSingleObject(&wait, parent, onParentsEnd, nullptr, INFINITE, WT_EXECUTEONLYONCE);
}

} // namespace

void TerminationSignal::install()
{
    requests(); // made before the first request
    SetConsoleCtrlHandler(onConsoleEvent, TRUE);
    watchParent();
    // The window lives as long as the process.
    static const HANDLE created = [] {
        const HANDLE event = CreateEventW(nullptr, TRUE, FALSE, nullptr);
        if (const HANDLE thread = CreateThread(nullptr, 0, runWindow, event, 0, nullptr)) {
            CloseHandle(thread);
            WaitForSingleObject(event, kWindowPatience);
        }
        return event;
    }();
    static_cast<void>(created);
}

void TerminationSignal::raise() { ReleaseSemaphore(requests(), 1, nullptr); }

bool TerminationSignal::wait(std::chrono::milliseconds timeout)
{
    return WaitForSingleObject(requests(), static_cast<DWORD>(timeout.count())) == WAIT_OBJECT_0;
}
