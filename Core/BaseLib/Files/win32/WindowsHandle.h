#pragma once

#include <windows.h>

/// Owns a handle of the system and closes it. Null and INVALID_HANDLE_VALUE both stand for a failed call.
class WindowsHandle {
public:
    explicit WindowsHandle(HANDLE handle)
        : m_handle(handle)
    {}
    ~WindowsHandle()
    {
        if (isValid())
            CloseHandle(m_handle);
    }
    WindowsHandle(const WindowsHandle &) = delete;
    WindowsHandle &operator=(const WindowsHandle &) = delete;

    bool isValid() const { return m_handle && m_handle != INVALID_HANDLE_VALUE; }
    HANDLE get() const { return m_handle; }

private:
    HANDLE m_handle;
};
