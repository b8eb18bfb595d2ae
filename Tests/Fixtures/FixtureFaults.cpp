#include "Tests/Fixtures/FixtureFaults.h"

#include "Tests/Fixtures/FixturePlatform.h"

#include <cfenv>
#include <clocale>
#include <csignal>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <filesystem>
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

void hang()
{
    for (;;)
        sleepMilliseconds(1000);
}

const struct {
    const char *kind;
    FixtureFault commit;
} kFaults[] = {{"segv", writeToInvalidAddress},
               {"abort", [] { std::abort(); }},
               {"exit", [] { std::exit(0); }},
               {"_exit", [] { endProcess(0); }},
               {"divide", divideByZero},
               {"illegal", [] { __builtin_trap(); }},
               {"stack-overflow", [] { consumeStack(0); }},
               {"throw-std", [] { throw std::runtime_error("thrown by the fixture"); }},
               {"throw-int", [] { throw 42; }},
               {"terminate", [] { std::terminate(); }},
               {"kill", killProcess},
               {"hang", hang},
               {"pthread-exit", endThread}};

bool changeLocale(const std::string &name) { return std::setlocale(LC_ALL, name.c_str()) != nullptr; }

bool changeFileMask(const std::string &octal)
{
    char *end = nullptr;
    setFileMask(static_cast<int>(std::strtol(octal.c_str(), &end, 8)));
    return !octal.empty() && *end == '\0';
}

bool changeWorkingFolder(const std::string &path)
{
    std::error_code error;
    std::filesystem::current_path(std::filesystem::u8path(path), error);
    return !error;
}

bool changeRounding(const std::string &direction)
{
    if (direction == "up")
        return std::fesetround(FE_UPWARD) == 0;
    return direction == "zero" && std::fesetround(FE_TOWARDZERO) == 0;
}

/// Installs a handler that does nothing.
bool installSignalHandler(const std::string &name)
{
    if (name != "segv" && name != "term")
        return false;
    return std::signal(name == "segv" ? SIGSEGV : SIGTERM, [](int) {}) != SIG_ERR;
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

const FixtureSideEffect kSideEffects[] = {
    {"locale", true, changeLocale},         {"umask", true, changeFileMask},
    {"chdir", true, changeWorkingFolder},   {"rounding", true, changeRounding},
    {"signal", true, installSignalHandler}, {"alarm", true, startAlarm},
    {"repair", true, repairOwnViolation},   {"print", true, printMuch},
    {"thread", false, leaveThreadRunning}};

} // namespace

FixtureFault findFault(const std::string &kind)
{
    for (const auto &entry : kFaults)
        if (kind == entry.kind)
            return entry.commit;
    return nullptr;
}

const FixtureSideEffect *findSideEffect(const std::string &kind)
{
    for (const FixtureSideEffect &entry : kSideEffects)
        if (kind == entry.kind)
            return &entry;
    return nullptr;
}
