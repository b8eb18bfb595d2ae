#include "Tests/Fixtures/FixtureFaults.h"

#include "Tests/Fixtures/FixturePlatform.h"

#include <cfenv>
#include <clocale>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <stdexcept>
#include <thread>

namespace {

// Volatile throughout, so that the compiler neither foresees a fault nor leaves it out.

void writeToInvalidAddress()
{
    volatile std::uintptr_t address = 16;
    *reinterpret_cast<volatile int *>(address) = 1;
}

void divideByZero()
{
    volatile int dividend = 1;
    volatile int zero = 0;
    volatile int result = dividend / zero; // NOLINT(clang-analyzer-core.DivideZero): that is the fault
    static_cast<void>(result);
}

int consumeStack(volatile int depth)
{
    volatile char frame[4096];
    frame[0] = static_cast<char>(depth);
    return depth < 0 ? 0 : consumeStack(depth + 1) + frame[0];
}

void overflowStack() { consumeStack(0); }

void runIllegalInstruction() { __builtin_trap(); }

void exitInOrder() { std::exit(0); }

void exitAtOnce() { endProcess(0); }

void throwStandardException() { throw std::runtime_error("thrown by the fixture"); }

void throwInteger() { throw 42; }

void hang()
{
    for (;;)
        sleepMilliseconds(1000);
}

const struct {
    const char *kind;
    void (*commit)();
} kFaults[] = {{"segv", writeToInvalidAddress},
               {"abort", [] { std::abort(); }},
               {"exit", exitInOrder},
               {"_exit", exitAtOnce},
               {"divide", divideByZero},
               {"illegal", runIllegalInstruction},
               {"stack-overflow", overflowStack},
               {"throw-std", throwStandardException},
               {"throw-int", throwInteger},
               {"terminate", [] { std::terminate(); }},
               {"kill", killProcess},
               {"hang", hang},
               {"pthread-exit", endThread}};

bool changeLocale(const std::string &name) { return std::setlocale(LC_ALL, name.c_str()) != nullptr; }

bool changeRounding(const std::string &direction)
{
    const struct {
        const char *name;
        int mode;
    } modes[] = {{"up", FE_UPWARD}, {"down", FE_DOWNWARD}, {"zero", FE_TOWARDZERO}};
    for (const auto &entry : modes) {
        if (direction == entry.name)
            return std::fesetround(entry.mode) == 0;
    }
    return false;
}

/// The thread keeps returning to this module's code: it dies when the module is unmapped under it.
bool leaveThreadRunning(const std::string &)
{
    std::thread([] {
        for (;;)
            sleepMilliseconds(1);
    }).detach();
    return true;
}

bool printMuch(const std::string &kibibytes)
{
    const long count = std::strtol(kibibytes.c_str(), nullptr, 10);
    const std::string text = std::string(1023, '.') + '\n';
    for (long i = 0; i < count; ++i)
        for (std::FILE *stream : {stdout, stderr})
            std::fputs(text.c_str(), stream);
    std::fflush(stdout);
    return count > 0;
}

const struct SideEffect {
    const char *kind;
    bool takesValue;
    bool (*cause)(const std::string &value);
} kSideEffects[] = {{"locale", true, changeLocale},         {"umask", true, changeFileMask},
                    {"chdir", true, changeWorkingFolder},   {"rounding", true, changeRounding},
                    {"signal", true, installSignalHandler}, {"alarm", true, startAlarm},
                    {"repair", true, repairOwnViolation},   {"print", true, printMuch},
                    {"thread", false, leaveThreadRunning}};

const SideEffect *findSideEffect(const std::string &kind)
{
    for (const SideEffect &entry : kSideEffects) {
        if (kind == entry.kind)
            return &entry;
    }
    return nullptr;
}

} // namespace

bool isFault(const std::string &kind)
{
    for (const auto &entry : kFaults) {
        if (kind == entry.kind)
            return true;
    }
    return false;
}

void commitFault(const std::string &kind)
{
    for (const auto &entry : kFaults) {
        if (kind == entry.kind)
            entry.commit();
    }
}

bool isSideEffect(const std::string &kind) { return findSideEffect(kind) != nullptr; }

bool sideEffectTakesValue(const std::string &kind)
{
    const SideEffect *entry = findSideEffect(kind);
    return entry && entry->takesValue;
}

bool causeSideEffect(const std::string &kind, const std::string &value)
{
    const SideEffect *entry = findSideEffect(kind);
    return entry && entry->cause(value);
}
