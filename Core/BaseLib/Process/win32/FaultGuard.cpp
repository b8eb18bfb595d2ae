#include "Core/BaseLib/Process/FaultGuard.h"

#include "Core/BaseLib/Process/win32/CrashHandler.h"
#include "Core/BaseLib/Process/win32/MicrosoftException.h"

#include <cstddef>

#include <malloc.h>
#include <windows.h>

// Comes back a second time when a guard's context is restored; the compiler must know.
extern "C" __declspec(dllimport) void NTAPI RtlCaptureContext(PCONTEXT) __attribute__((returns_twice));

namespace {

/// What the system keeps free of the stack to handle its overflow, in bytes.
constexpr ULONG kOverflowReserve = 64 * 1024;
/// Exceptions of this program's own compiler have codes that end so (libgcc's unwind-seh.c).
constexpr DWORD kOwnExceptions = 0x474343;
/// Where the trampoline keeps its guard, from the start of its frame.
constexpr std::size_t kGuardPlace = 32;

/// One guarded call in progress.
struct Guard {
    CONTEXT context;
    FaultGuardDetail::Watch watch;
    volatile DWORD code = 0; ///< of what ended the call, or 0
    char text[512] = {};     ///< about it: of an exception of another compiler its own
};

} // namespace

extern "C" {

/// Calls `function(argument)` from a frame whose handler is ours.
void fxprobeGuardTrampoline(void (*function)(void *), void *argument, Guard *guard);
/// The place in the trampoline behind that call.
void fxprobeGuardReturn();

/// Asked by the system what to do about an exception below the trampoline, after the handlers of the frames
/// between: what a plug-in handles itself (copy protection does) never gets here. Nothing is thrown from
/// here, through frames that cannot be unwound; the guard does that from its own.
[[gnu::used]] EXCEPTION_DISPOSITION fxprobeGuardHandler(EXCEPTION_RECORD *record, void *frame,
                                                        CONTEXT *context, DISPATCHER_CONTEXT *dispatcher)
{
    const bool isUnwinding = (record->ExceptionFlags & (EXCEPTION_UNWINDING | EXCEPTION_EXIT_UNWIND)) != 0;
    if (isUnwinding || (record->ExceptionCode & 0xFFFFFF) == kOwnExceptions)
        return ExceptionContinueSearch;
    Guard *guard = *reinterpret_cast<Guard **>(static_cast<std::byte *>(frame) + kGuardPlace);
    if (record->ExceptionCode == MicrosoftException::kCode) {
        MicrosoftException::describe(*record, guard->text, sizeof guard->text);
        guard->code = record->ExceptionCode;
        // Its frames expect to be unwound, as for a `catch` of their own.
        RtlUnwindEx(frame, reinterpret_cast<void *>(fxprobeGuardReturn), record, nullptr, context,
                    dispatcher->HistoryTable);
    } else if (guard->watch == FaultGuardDetail::Watch::FaultsAndForeignExceptions) {
        guard->code = record->ExceptionCode;
        describeFault(*record, *context, guard->text, sizeof guard->text);
        // Not unwound: after a fault the plug-in's state is unknown, and an overflowed stack has no room.
        RtlRestoreContext(&guard->context, nullptr);
    }
    return ExceptionContinueSearch;
}
}

// The caller's four words of stack for the callee, then the guard; together they keep the stack aligned. The
// instruction behind the call keeps its return address clear of the frame's end.
asm(R"(
        .text
        .globl  fxprobeGuardTrampoline
        .globl  fxprobeGuardReturn
        .def    fxprobeGuardTrampoline; .scl 2; .type 32; .endef
        .seh_proc fxprobeGuardTrampoline
fxprobeGuardTrampoline:
        subq    $40, %rsp
        .seh_stackalloc 40
        .seh_endprologue
        .seh_handler fxprobeGuardHandler, @except
        movq    %r8, 32(%rsp)
        movq    %rcx, %rax
        movq    %rdx, %rcx
        call    *%rax
        nop
fxprobeGuardReturn:
        addq    $40, %rsp
        ret
        .seh_endproc
)");

namespace {

/// NOTE: Wine commits a stack whole, with its guard on the last page, and keeps it there whatever was asked
/// for. An overflow is then raised where nothing can handle it, and Wine ends the thread. So the guard is put
/// where Windows has it.
void guardReserve()
{
    MEMORY_BASIC_INFORMATION stack = {}, reserve = {};
    SYSTEM_INFO system = {};
    GetSystemInfo(&system);
    VirtualQuery(&stack, &stack, sizeof stack);
    // Below it lies the page that nothing may touch.
    auto *start = static_cast<std::byte *>(stack.AllocationBase) + system.dwPageSize;
    auto *end = start + kOverflowReserve;
    VirtualQuery(end - 1, &reserve, sizeof reserve);
    const bool isOpen = reserve.State == MEM_COMMIT && (reserve.Protect & PAGE_GUARD) == 0;
    DWORD before = 0;
    if (isOpen && reinterpret_cast<std::byte *>(&stack) > end)
        VirtualProtect(start, kOverflowReserve, PAGE_READWRITE | PAGE_GUARD, &before);
}

/// Once for each thread: an overflow leaves too little room to find the guard's frame in.
void reserveForOverflow()
{
    thread_local const bool reserved = [] {
        ULONG size = kOverflowReserve;
        const bool granted = SetThreadStackGuarantee(&size) != 0;
        if (granted)
            guardReserve();
        return granted;
    }();
    static_cast<void>(reserved);
}

} // namespace

void FaultGuardDetail::run(Watch watch, void (*function)(void *), void *argument)
{
    reserveForOverflow();
    Guard guard;
    guard.watch = watch;
    RtlCaptureContext(&guard.context); // a fault comes back here
    if (guard.code == 0)
        fxprobeGuardTrampoline(function, argument, &guard);
    if (guard.code == 0)
        return;
    if (guard.code == MicrosoftException::kCode)
        throw ForeignException(guard.text);
    if (guard.code == FaultCode::kStackOverflow)
        _resetstkoflw(); // else the next one ends the process
    throw SEException(guard.code, guard.text);
}
