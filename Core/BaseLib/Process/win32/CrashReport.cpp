#include "Core/BaseLib/Process/CrashReport.h"

#include "Core/BaseLib/Process/CrashText.h"
#include "Core/BaseLib/Process/win32/CrashHandler.h"

#include <QDir>

#include <atomic>
#include <cwchar>

#include <windows.h>

namespace {

HANDLE s_output = nullptr;
DWORD s_thread = 0;
wchar_t s_plugin[32768] = {}; ///< longest path (NTFS)
std::atomic_flag s_isDescribing = ATOMIC_FLAG_INIT;

const char *wordsOf(DWORD code)
{
    switch (code) {
    case EXCEPTION_ACCESS_VIOLATION:
        return "invalid memory access";
    case EXCEPTION_IN_PAGE_ERROR:
        return "access to memory that is not there";
    case EXCEPTION_INT_DIVIDE_BY_ZERO:
    case EXCEPTION_FLT_DIVIDE_BY_ZERO:
        return "division by zero";
    case EXCEPTION_ILLEGAL_INSTRUCTION:
    case EXCEPTION_PRIV_INSTRUCTION:
        return "illegal instruction";
    case EXCEPTION_STACK_OVERFLOW:
        return "stack overflow";
    case EXCEPTION_BREAKPOINT:
        return "breakpoint";
    default:
        return "unhandled exception";
    }
}

/// What a frame without a table returns to; 0 where the stack is damaged.
quint64 topOfStack(const CONTEXT &context)
{
    const auto *top = reinterpret_cast<const quint64 *>(context.Rsp);
    MEMORY_BASIC_INFORMATION memory = {};
    const bool isStack = context.Rsp % sizeof *top == 0 && VirtualQuery(top, &memory, sizeof memory) != 0 &&
                         memory.State == MEM_COMMIT && memory.Protect == PAGE_READWRITE;
    return isStack ? *top : 0;
}

/// Where a call led to no code, the place behind the call. 0 for any other fault.
quint64 callerOf(const EXCEPTION_RECORD &record, const CONTEXT &context)
{
    const bool isInCode = record.ExceptionCode != EXCEPTION_ACCESS_VIOLATION || record.NumberParameters < 2 ||
                          record.ExceptionInformation[1] != context.Rip;
    return isInCode ? 0 : topOfStack(context);
}

/// Tells of a place which module it lies in.
void locate(CrashPlace &place)
{
    HMODULE module = nullptr;
    const DWORD flags = GET_MODULE_HANDLE_EX_FLAG_FROM_ADDRESS | GET_MODULE_HANDLE_EX_FLAG_UNCHANGED_REFCOUNT;
    if (!GetModuleHandleExW(flags, reinterpret_cast<const wchar_t *>(place.address), &module))
        return;
    static wchar_t path[32768];
    static char name[3 * 32768]; // of UTF-8 for each unit of UTF-16
    GetModuleFileNameW(module, path, DWORD(std::size(path)));
    WideCharToMultiByte(CP_UTF8, 0, path, -1, name, sizeof name, nullptr, nullptr);
    place.offset = place.address - reinterpret_cast<quint64>(module);
    place.isPlugin = s_plugin[0] && _wcsnicmp(path, s_plugin, std::wcslen(s_plugin)) == 0;
    setName(place, name);
}

/// The frames from the one that failed outwards, by the tables that modules have for it.
std::size_t framesFrom(CONTEXT context, CrashPlaces &frames)
{
    std::size_t count = 0;
    while (count < frames.size() && context.Rip != 0) {
        frames[count].address = context.Rip;
        locate(frames[count++]);
        DWORD64 base = 0;
        PRUNTIME_FUNCTION function = RtlLookupFunctionEntry(context.Rip, &base, nullptr);
        if (!function && count > 1) // only the innermost function may go without
            break;
        if (!function) {
            context.Rip = topOfStack(context);
            context.Rsp += sizeof context.Rip;
            continue;
        }
        void *handlerData = nullptr;
        DWORD64 frame = 0;
        RtlVirtualUnwind(UNW_FLAG_NHANDLER, base, context.Rip, function, &context, &handlerData, &frame,
                         nullptr);
    }
    return count;
}

void print(const CrashText &text)
{
    DWORD written = 0;
    WriteFile(s_output, text.data(), static_cast<DWORD>(text.size()), &written, nullptr);
}

LONG WINAPI describe(EXCEPTION_POINTERS *fault)
{
    if (s_isDescribing.test_and_set())
        return EXCEPTION_CONTINUE_SEARCH;
    static char words[512];
    CONTEXT context = *fault->ContextRecord;
    describeFault(*fault->ExceptionRecord, context, words, sizeof words);
    static CrashPlaces frames;
    const bool isOwnThread = GetCurrentThreadId() != s_thread;
    // Before the frames are looked for, which may be a fault of its own in a stack that is damaged.
    print(crashText(words, frames, 0, isOwnThread));
    if (const quint64 caller = callerOf(*fault->ExceptionRecord, context)) {
        context.Rip = caller;
        context.Rsp += sizeof caller;
    }
    const std::size_t count = framesFrom(context, frames);
    print(crashText(words, frames, count, isOwnThread));
    return EXCEPTION_CONTINUE_SEARCH;
}

} // namespace

void describeFault(const EXCEPTION_RECORD &record, const CONTEXT &context, char *words, std::size_t size)
{
    static std::atomic_flag isAtWork = ATOMIC_FLAG_INIT; // of several threads one is described whole
    const DWORD code = record.ExceptionCode;
    CrashText text;
    text << wordsOf(code);
    if (code == EXCEPTION_ACCESS_VIOLATION && record.NumberParameters > 1)
        text << " at " << static_cast<quint64>(record.ExceptionInformation[1]);
    else if (wordsOf(code) == wordsOf(0))
        text << " " << static_cast<quint64>(code);
    if (!isAtWork.test_and_set()) {
        const quint64 caller = callerOf(record, context);
        CrashPlace place;
        place.address = caller != 0 ? caller : reinterpret_cast<quint64>(record.ExceptionAddress);
        locate(place);
        text << (caller != 0 ? ", called from " : " in ") << place;
        isAtWork.clear();
    }
    text.copyTo(words, size);
}

void CrashReport::install()
{
    s_thread = GetCurrentThreadId();
    DuplicateHandle(GetCurrentProcess(), GetStdHandle(STD_ERROR_HANDLE), GetCurrentProcess(), &s_output, 0,
                    FALSE, DUPLICATE_SAME_ACCESS);
    SetUnhandledExceptionFilter(describe);
}

void CrashReport::setPlugin(const QString &path)
{
    const int length = QDir::toNativeSeparators(path).left(32767).toWCharArray(s_plugin);
    s_plugin[length] = 0;
}
