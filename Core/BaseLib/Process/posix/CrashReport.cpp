#include "Core/BaseLib/Process/CrashReport.h"

#include "Core/BaseLib/Process/CrashText.h"
#include "Core/BaseLib/Process/posix/CrashHandler.h"

#include <QFile>

#include <algorithm>
#include <atomic>
#include <climits>
#include <cstring>

#include <execinfo.h>
#include <fcntl.h>
#include <sys/uio.h>
#include <ucontext.h>
#include <unistd.h>

namespace {

constexpr int kSignals[] = {SIGSEGV, SIGBUS, SIGFPE, SIGILL, SIGABRT, SIGTRAP, SIGSYS};
/// Away from the low numbers, which plug-ins close and open by habit.
constexpr int kLeastDescriptor = 100;
/// Frames of the handler and of the C library's way into it come first.
constexpr std::size_t kHandlerFrames = 8;
constexpr std::size_t kHandlerStack = std::size_t(256) * 1024;

int s_output = -1;
pid_t s_thread = 0;
char s_plugin[PATH_MAX] = {};
std::atomic_flag s_isDescribing = ATOMIC_FLAG_INIT;

quint64 registerOf(const void *context, int number)
{
    return static_cast<quint64>(static_cast<const ucontext_t *>(context)->uc_mcontext.gregs[number]);
}

/// Whether a fault came up where the stack would have grown to.
bool isStackOverflow(const siginfo_t *info, const void *context)
{
    constexpr quint64 kNear =
        quint64(64) * 1024; // more than any frame that is entered without a look at its end
    return reinterpret_cast<quint64>(info->si_addr) + kNear - registerOf(context, REG_RSP) < 2 * kNear;
}

/// Where a call led to no code, the place behind the call: it is on top of the stack. 0 for any other fault.
quint64 callerOf(int signalNumber, const siginfo_t *info, const void *context)
{
    const bool isInCode = reinterpret_cast<quint64>(info->si_addr) != registerOf(context, REG_RIP);
    if (signalNumber != SIGSEGV || isInCode)
        return 0;
    quint64 caller = 0;
    const iovec target = {&caller, sizeof caller};
    const iovec stack = {reinterpret_cast<void *>(registerOf(context, REG_RSP)), sizeof caller};
    // By way of the system, which fails where the stack is damaged.
    return process_vm_readv(getpid(), &target, 1, &stack, 1, 0) == sizeof caller ? caller : 0;
}

const char *wordsOf(int signalNumber, const siginfo_t *info, const void *context)
{
    switch (signalNumber) {
    case SIGSEGV:
        return isStackOverflow(info, context) ? "stack overflow" : "invalid memory access";
    case SIGBUS:
        return "access to memory that is not there";
    case SIGFPE:
        return info->si_code == FPE_INTDIV ? "division by zero" : "arithmetic fault";
    case SIGILL:
        return "illegal instruction";
    case SIGABRT:
        return "it gave up (abort)";
    case SIGTRAP:
        return "breakpoint";
    default:
        return "forbidden system call";
    }
}

/// Reads lines of a file with what is allowed in a signal handler.
class Lines {
public:
    explicit Lines(const char *path)
        : m_file(open(path, O_RDONLY | O_CLOEXEC))
    {}
    ~Lines() { close(m_file); }
    Lines(const Lines &) = delete;
    Lines &operator=(const Lines &) = delete;

    /// The next line, cut where it is too long; false at the end.
    bool next(char *line, std::size_t size)
    {
        std::size_t length = 0;
        for (;;) {
            if (m_next == m_count) {
                m_count = ::read(m_file, m_block, sizeof m_block);
                m_next = 0;
                if (m_count <= 0)
                    return false;
            }
            const char character = m_block[m_next++];
            if (character == '\n')
                break;
            if (length + 1 < size)
                line[length++] = character;
        }
        line[length] = 0;
        return true;
    }

private:
    int m_file;
    char m_block[4096] = {};
    ssize_t m_count = 0;
    ssize_t m_next = 0;
};

quint64 hexadecimal(const char *&text)
{
    quint64 number = 0;
    for (;; ++text) {
        const char *const digits = "0123456789abcdef";
        const char *const digit = *text ? std::strchr(digits, *text) : nullptr;
        if (!digit)
            return number;
        number = number << 4 | static_cast<quint64>(digit - digits);
    }
}

/// Tells of each place which module it lies in (proc(5): /proc/pid/maps).
void locate(CrashPlaces &places, std::size_t count)
{
    char line[PATH_MAX + 128] = {}; // the other columns are shorter
    char module[PATH_MAX] = {};
    quint64 base = 0;
    Lines maps("/proc/self/maps");
    while (maps.next(line, sizeof line)) {
        const char *rest = line;
        const quint64 start = hexadecimal(rest);
        ++rest;
        const quint64 end = hexadecimal(rest);
        const char *const path = std::strchr(rest, '/');
        if (!path || std::strcmp(path, module) != 0) {
            base = start;
            qstrncpy(module, path ? path : "", sizeof module);
        }
        for (std::size_t index = 0; index < count; ++index) {
            CrashPlace &place = places[index];
            if (!path || place.address < start || place.address >= end)
                continue;
            place.offset = place.address - base;
            place.isPlugin = s_plugin[0] && std::strncmp(path, s_plugin, std::strlen(s_plugin)) == 0;
            setName(place, path);
        }
    }
}

void print(const CrashText &text)
{
    [[maybe_unused]] const ssize_t count = ::write(s_output, text.data(), text.size());
}

/// The frames from the one that failed outwards.
std::size_t framesFrom(quint64 counter, CrashPlaces &frames)
{
    static void *addresses[kMaxCrashFrames + kHandlerFrames];
    const auto count = static_cast<std::size_t>(backtrace(addresses, static_cast<int>(std::size(addresses))));
    const auto at = [](std::size_t index) { return reinterpret_cast<quint64>(addresses[index]); };
    std::size_t first = 0;
    while (first < count && at(first) != counter)
        ++first;
    std::size_t found = 0;
    for (; first < count && found < frames.size(); ++first)
        frames[found++].address = at(first);
    return found;
}

void onSignal(int signalNumber, siginfo_t *info, void *context)
{
    describeCrash(signalNumber, info, context);
    std::signal(signalNumber, SIG_DFL);
    raise(signalNumber); // comes when this returns
}

} // namespace

void describeFault(int signalNumber, const siginfo_t *info, const void *context, char *words,
                   std::size_t size)
{
    CrashText text;
    text << wordsOf(signalNumber, info, context);
    const bool isFault = info->si_code > 0;                        // not sent by a process (sigaction(2))
    const bool hasAddress = isFault && info->si_code != SI_KERNEL; // which is told of no address
    if (hasAddress && (signalNumber == SIGSEGV || signalNumber == SIGBUS))
        text << " at " << reinterpret_cast<quint64>(info->si_addr);
    const quint64 caller = hasAddress ? callerOf(signalNumber, info, context) : 0;
    CrashPlaces places;
    places[0].address = caller != 0 ? caller : registerOf(context, REG_RIP);
    if (isFault) {
        locate(places, 1);
        text << (caller != 0 ? ", called from " : " in ") << places[0];
    }
    text.copyTo(words, size);
}

void describeCrash(int signalNumber, const siginfo_t *info, const void *context)
{
    if (s_output < 0 || s_isDescribing.test_and_set())
        return;
    static char words[512];
    describeFault(signalNumber, info, context, words, sizeof words);
    const bool isOwnThread = gettid() != s_thread;
    static CrashPlaces frames;
    // Before the frames are looked for, which may be a fault of its own in a stack that is damaged.
    print(crashText(words, frames, 0, isOwnThread));
    std::size_t count = framesFrom(registerOf(context, REG_RIP), frames);
    // Nothing leads on from where there is no code.
    if (const quint64 caller = callerOf(signalNumber, info, context)) {
        frames[0].address = caller;
        count = 1;
    }
    locate(frames, count);
    if (count > 0)
        print(crashText(words, frames, count, isOwnThread));
}

void CrashReport::install()
{
    s_thread = gettid();
    s_output = fcntl(STDERR_FILENO, F_DUPFD_CLOEXEC, kLeastDescriptor);
    void *preload[1];
    backtrace(preload, 1); // its library is loaded when it is called first
    static char stack[kHandlerStack];
    stack_t handlerStack = {};
    handlerStack.ss_sp = stack;
    handlerStack.ss_size = sizeof stack;
    sigaltstack(&handlerStack, nullptr);
    for (const int number : kSignals) {
        struct sigaction action = {};
        action.sa_sigaction = onSignal;
        action.sa_flags = SA_SIGINFO | SA_ONSTACK;
        sigemptyset(&action.sa_mask);
        sigaction(number, &action, nullptr);
    }
}

void CrashReport::setPlugin(const QString &path)
{
    const QByteArray name = QFile::encodeName(path);
    qstrncpy(s_plugin, name.constData(), sizeof s_plugin);
}
