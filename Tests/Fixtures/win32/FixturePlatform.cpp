#include "Tests/Fixtures/FixturePlatform.h"

#include <cstdlib>
#include <filesystem>

#include <io.h>
#include <windows.h>

std::string modulePath()
{
    HMODULE module = nullptr;
    GetModuleHandleExW(GET_MODULE_HANDLE_EX_FLAG_FROM_ADDRESS | GET_MODULE_HANDLE_EX_FLAG_UNCHANGED_REFCOUNT,
                       reinterpret_cast<const wchar_t *>(&modulePath), &module);
    std::wstring path(32768, L'\0');
    path.resize(GetModuleFileNameW(module, path.data(), static_cast<DWORD>(path.size())));
    return std::filesystem::path(path).generic_u8string();
}

bool appendToFile(const std::string &path, const std::string &text)
{
    // Whoever reads the file must be able to remove it meanwhile, as elsewhere.
    const HANDLE file = CreateFileW(std::filesystem::u8path(path).c_str(), FILE_APPEND_DATA,
                                    FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE, nullptr,
                                    OPEN_ALWAYS, FILE_ATTRIBUTE_NORMAL, nullptr);
    if (file == INVALID_HANDLE_VALUE)
        return false;
    DWORD written = 0;
    WriteFile(file, text.data(), static_cast<DWORD>(text.size()), &written, nullptr);
    CloseHandle(file);
    return written == text.size();
}

void endProcess(int exitCode)
{
    TerminateProcess(GetCurrentProcess(), static_cast<UINT>(exitCode));
    std::abort();
}

void killProcess() { TerminateProcess(GetCurrentProcess(), 1); }

void endThread() { ExitThread(0); }

bool causePlatformEffect(const std::string &, const std::string &) { return false; }

void setFileMask(int mask) { _umask(mask); }

bool startAlarm(const std::string &seconds) { return std::strtol(seconds.c_str(), nullptr, 10) > 0; }
