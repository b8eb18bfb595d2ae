#include "Tests/Fixtures/FixturePlatform.h"

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <vector>

#include <io.h>
#include <windows.h>

#include <tlhelp32.h>

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
    const HANDLE file = CreateFileW(std::filesystem::u8path(path).c_str(), FILE_APPEND_DATA | FILE_READ_DATA,
                                    FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE, nullptr,
                                    OPEN_ALWAYS, FILE_ATTRIBUTE_NORMAL, nullptr);
    if (file == INVALID_HANDLE_VALUE)
        return false;
    // NOTE: Wine looks for the file's end and writes in two steps, so that of two modules that write at
    // once the later line would replace the earlier one. The locked byte is far behind what is read.
    OVERLAPPED farAway = {};
    farAway.OffsetHigh = 0x40000000;
    DWORD written = 0;
    if (LockFileEx(file, LOCKFILE_EXCLUSIVE_LOCK, 0, 1, 0, &farAway) != FALSE)
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

namespace {

/// Another process of this program that never begins; it stays until it is ended.
PROCESS_INFORMATION startIdle(DWORD flags)
{
    std::wstring program(32768, L'\0');
    GetModuleFileNameW(nullptr, program.data(), static_cast<DWORD>(program.size()));
    STARTUPINFOW start = {};
    start.cb = sizeof start;
    PROCESS_INFORMATION process = {};
    // NOTE: Wine 8 at times starts no process on a busy machine, but does when it is asked again.
    for (int attempt = 0; attempt < 3 && process.dwProcessId == 0; ++attempt)
        CreateProcessW(program.c_str(), nullptr, nullptr, nullptr, FALSE, CREATE_SUSPENDED | flags, nullptr,
                       nullptr, &start, &process);
    return process;
}

bool leaveIdle(DWORD flags, const std::string &file)
{
    const DWORD number = startIdle(flags).dwProcessId;
    return number != 0 && appendToFile(file, std::to_string(number) + '\n');
}

/// The process that started this one; 0 when the system does not tell.
DWORD parentProcess()
{
    PROCESSENTRY32W entry = {};
    entry.dwSize = sizeof entry;
    const HANDLE all = CreateToolhelp32Snapshot(TH32CS_SNAPPROCESS, 0);
    bool isFound = Process32FirstW(all, &entry);
    while (isFound && entry.th32ProcessID != GetCurrentProcessId())
        isFound = Process32NextW(all, &entry);
    CloseHandle(all);
    return isFound ? entry.th32ParentProcessID : 0;
}

/// More than a process has that was just started.
constexpr std::uintptr_t kLastHandle = 4096;

HANDLE handleOf(std::uintptr_t number) { return reinterpret_cast<HANDLE>(number); }

} // namespace

bool leaveChild(const std::string &file) { return leaveIdle(0, file); }

bool leaveDaemon(const std::string &file)
{
    return leaveIdle(DETACHED_PROCESS | CREATE_NEW_PROCESS_GROUP, file);
}

bool feedChild(const std::string &mebibytes)
{
    const std::vector<char> block(std::strtoul(mebibytes.c_str(), nullptr, 10) << 20, 1);
    const HANDLE process = startIdle(0).hProcess;
    void *const place =
        VirtualAllocEx(process, nullptr, block.size(), MEM_COMMIT | MEM_RESERVE, PAGE_READWRITE);
    return place && WriteProcessMemory(process, place, block.data(), block.size(), nullptr);
}

bool outliveParent() { return true; }

bool killParent() { return TerminateProcess(OpenProcess(PROCESS_TERMINATE, FALSE, parentProcess()), 1); }

bool writeEverywhere()
{
    for (std::uintptr_t number = 4; number < kLastHandle; number += 4) {
        DWORD count = 0;
        if (GetFileType(handleOf(number)) == FILE_TYPE_PIPE)
            WriteFile(handleOf(number), "garbage garbage ", 16, &count, nullptr);
    }
    return true;
}

bool closeEverything()
{
    for (std::uintptr_t number = 4; number < kLastHandle; number += 4)
        CloseHandle(handleOf(number));
    return true;
}

bool hasTerminal()
{
    return CreateFileW(L"CONOUT$", GENERIC_WRITE, FILE_SHARE_WRITE, nullptr, OPEN_EXISTING, 0, nullptr) !=
           INVALID_HANDLE_VALUE;
}

void setFileMask(int mask) { _umask(mask); }

bool startAlarm(const std::string &seconds) { return std::strtol(seconds.c_str(), nullptr, 10) > 0; }
