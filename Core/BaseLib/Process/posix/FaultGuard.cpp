#include "Core/BaseLib/Process/FaultGuard.h"

#include "Core/BaseLib/Process/posix/CrashHandler.h"

#include <csetjmp>
#include <csignal>
#include <cstddef>
#include <memory>

#include <unistd.h>

namespace {

/// Enough for the handler, whatever the processor's vector registers add to its frame.
constexpr std::size_t kHandlerStackSize = std::size_t(256) * 1024;
constexpr int kFaultSignals[] = {SIGSEGV, SIGBUS, SIGFPE, SIGILL};

/// One guarded call in progress; the innermost one of its thread while it lives.
struct Guard {
    Guard();
    ~Guard();
    Guard(const Guard &) = delete;
    Guard &operator=(const Guard &) = delete;

    sigjmp_buf context;
    volatile quint32 code = 0; ///< of the fault that came, or 0
    char words[256] = {};      ///< about it
    Guard *outer;
};

thread_local Guard *t_innermost = nullptr;

Guard::Guard()
    : outer(t_innermost)
{
    t_innermost = this;
}

Guard::~Guard() { t_innermost = outer; }

/// The stack that this thread's handler runs on: after an overflow the thread's own has no room left.
class HandlerStack {
public:
    HandlerStack() { sigaltstack(nullptr, &m_previous); }
    ~HandlerStack() { sigaltstack(&m_previous, nullptr); }
    HandlerStack(const HandlerStack &) = delete;
    HandlerStack &operator=(const HandlerStack &) = delete;

    void install() const
    {
        stack_t stack = {};
        stack.ss_sp = m_memory.get();
        stack.ss_size = kHandlerStackSize;
        sigaltstack(&stack, nullptr);
    }

private:
    std::unique_ptr<std::byte[]> m_memory = std::make_unique<std::byte[]>(kHandlerStackSize);
    stack_t m_previous = {};
};

quint32 codeOf(int signalNumber)
{
    switch (signalNumber) {
    case SIGFPE:
        return FaultCode::kIntegerDivideByZero;
    case SIGILL:
        return FaultCode::kIllegalInstruction;
    default:
        return FaultCode::kAccessViolation;
    }
}

void onFault(int signalNumber, siginfo_t *info, void *context)
{
    if (Guard *guard = t_innermost) {
        guard->code = codeOf(signalNumber);
        describeFault(signalNumber, info, context, guard->words, sizeof guard->words);
        siglongjmp(guard->context, 1);
    }
    // No guard on this thread: end the process as usual.
    describeCrash(signalNumber, info, context);
    std::signal(signalNumber, SIG_DFL);
    raise(signalNumber);
}

/// Before each call: plug-ins install handlers and stacks of their own.
void arm()
{
    thread_local const HandlerStack stack;
    stack.install();
    sigset_t signals;
    sigemptyset(&signals);
    for (const int number : kFaultSignals) {
        sigaddset(&signals, number);
        struct sigaction action = {};
        action.sa_sigaction = onFault;
        action.sa_flags = SA_SIGINFO | SA_ONSTACK;
        sigemptyset(&action.sa_mask);
        sigaction(number, &action, nullptr);
    }
    pthread_sigmask(SIG_UNBLOCK, &signals, nullptr);
}

} // namespace

void FaultGuardDetail::run(Watch watch, void (*function)(void *), void *argument)
{
    // All compilers of the system share one run-time library for exceptions: none is foreign.
    if (watch == Watch::ForeignExceptions) {
        function(argument);
        return;
    }
    arm();
    Guard guard;
    // The handler comes back here; the exception starts in this frame, so that no frame of the plug-in is
    // unwound.
    if (sigsetjmp(guard.context, 1) == 0)
        function(argument);
    else
        throw SEException(guard.code, guard.words);
}
