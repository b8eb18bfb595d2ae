#include "Tests/Fixtures/FixturePlatform.h"

#include <cstdlib>
#include <filesystem>

#include <io.h>
#include <windows.h>

namespace {

const std::size_t kPageSize = 4096;

bool isViolation(const EXCEPTION_RECORD &record)
{
    return record.ExceptionCode == EXCEPTION_ACCESS_VIOLATION;
}

LONG WINAPI endAtViolation(EXCEPTION_POINTERS *fault)
{
    if (isViolation(*fault->ExceptionRecord))
        TerminateProcess(GetCurrentProcess(), EXCEPTION_ACCESS_VIOLATION);
    return EXCEPTION_CONTINUE_SEARCH;
}

} // namespace

extern "C" {

/// Writes one byte, in a frame whose handler is repairPage.
void writeIntoRepairedPage(void *address);

/// Makes the page at the address of the violation writable.
__attribute__((used)) EXCEPTION_DISPOSITION repairPage(EXCEPTION_RECORD *record, void *, CONTEXT *, void *)
{
    DWORD previous = 0;
    if (!isViolation(*record) || !VirtualProtect(reinterpret_cast<void *>(record->ExceptionInformation[1]),
                                                 kPageSize, PAGE_READWRITE, &previous))
        return ExceptionContinueSearch;
    return ExceptionContinueExecution;
}
}

__asm__(".text\n"
        ".seh_proc writeIntoRepairedPage\n"
        "writeIntoRepairedPage:\n"
        "  subq $40, %rsp\n"
        "  .seh_stackalloc 40\n"
        "  .seh_endprologue\n"
        "  .seh_handler repairPage, @except\n"
        "  movb $1, (%rcx)\n"
        "  nop\n"
        "  addq $40, %rsp\n"
        "  ret\n"
        ".seh_endproc\n");

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

void setFileMask(int mask) { _umask(mask); }

bool repairOwnViolation(const std::string &)
{
    void *page = VirtualAlloc(nullptr, kPageSize, MEM_RESERVE | MEM_COMMIT, PAGE_NOACCESS);
    if (!page)
        return false;
    writeIntoRepairedPage(page);
    SetUnhandledExceptionFilter(endAtViolation);
    return VirtualFree(page, 0, MEM_RELEASE) != FALSE;
}

bool startAlarm(const std::string &seconds) { return std::strtol(seconds.c_str(), nullptr, 10) > 0; }
