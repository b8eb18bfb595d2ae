#include "Tests/Fixtures/FixturePlatform.h"
#include "Tests/Fixtures/FixtureScript.h"

#include <cfenv>
#include <chrono>
#include <clocale>
#include <csignal>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <filesystem>
#include <map>
#include <stdexcept>
#include <thread>

namespace {

// Volatile throughout, so that the compiler neither foresees a fault nor leaves it out.

void writeToInvalidAddress()
{
    volatile std::uintptr_t address = 16;
    *reinterpret_cast<volatile int *>(address) = 1;
}

void callNothing()
{
    void (*volatile function)() = nullptr;
    function(); // NOLINT(clang-analyzer-core.CallAndMessage): that is the fault
}

void divideByZero()
{
    volatile int dividend = 1, zero = 0;
    volatile int result = dividend / zero; // NOLINT(clang-analyzer-core.DivideZero): that is the fault
    static_cast<void>(result);
}

int consumeStack(volatile int depth)
{
    volatile char frame[4096];
    frame[0] = static_cast<char>(depth);
    return depth < 0 ? 0 : consumeStack(depth + 1) + frame[0];
}

/// In a thread, it keeps returning to this module's code: it dies when the module is unmapped under it.
void sleepForEver()
{
    for (;;)
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
}

bool leaveThreadRunning(const std::string &)
{
    std::thread(sleepForEver).detach();
    return true;
}

bool faultLater(const std::string &milliseconds)
{
    std::thread([pause = std::chrono::milliseconds(std::stoi(milliseconds))] {
        std::this_thread::sleep_for(pause);
        writeToInvalidAddress();
    }).detach();
    return true;
}

void takeAllMemory()
{
    constexpr std::size_t kBlock = std::size_t(16) << 20;
    for (;;) {
        volatile char *block = new char[kBlock];
        for (std::size_t place = 0; place < kBlock; place += 4096)
            block[place] = 1;
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
}

bool printMuch(const std::string &kibibytes)
{
    const std::string text = std::string(1023, '.') + '\n';
    for (long count = std::strtol(kibibytes.c_str(), nullptr, 10); count > 0; --count)
        for (std::FILE *stream : {stdout, stderr})
            std::fputs(text.c_str(), stream);
    std::fflush(stdout); // may fail: a reader may go away
    return true;
}

bool changeFolder(const std::string &path)
{
    std::error_code error;
    std::filesystem::current_path(std::filesystem::u8path(path), error);
    return !error;
}

struct Textless : std::exception {
    const char *what() const noexcept override { return nullptr; }
};

} // namespace

bool commitFault(const std::string &kind)
{
    static const std::map<std::string, void (*)()> faults = {
        {"segv", writeToInvalidAddress},
        {"call-null", callNothing},
        {"abort", [] { std::abort(); }},
        {"exit", [] { std::exit(0); }},
        {"_exit", [] { endProcess(0); }},
        {"divide", divideByZero},
        {"illegal", [] { __builtin_trap(); }},
        {"stack-overflow", [] { consumeStack(0); }},
        {"throw-std", [] { throw std::runtime_error("thrown by the fixture"); }},
        {"throw-null", [] { throw Textless(); }},
        {"throw-int", [] { throw 42; }},
        {"terminate", [] { std::terminate(); }},
        {"kill", killProcess},
        {"hang", sleepForEver},
        {"memory", takeAllMemory},
        {"pthread-exit", endThread}};
    const auto fault = faults.find(kind);
    if (fault != faults.end())
        fault->second();
    return fault != faults.end();
}

bool causeSideEffect(const std::string &kind, const std::string &value)
{
    using Text = const std::string &;
    static const std::map<std::string, bool (*)(Text)> effects = {
        {"locale", [](Text name) { return std::setlocale(LC_ALL, name.c_str()) != nullptr; }},
        {"umask",
         [](Text octal) {
             setFileMask(std::stoi(octal, nullptr, 8));
             return true;
         }},
        {"chdir", changeFolder},
        {"rounding", [](Text way) { return std::fesetround(way == "up" ? FE_UPWARD : FE_TOWARDZERO) == 0; }},
        {"signal",
         [](Text name) { return std::signal(name == "segv" ? SIGSEGV : SIGTERM, [](int) {}) != SIG_ERR; }},
        {"alarm", startAlarm},
        {"print", printMuch},
        {"input", [](Text) { return std::getchar() == EOF; }},
        {"terminal", [](Text) { return !hasTerminal(); }},
        {"child", leaveChild},
        {"daemon", leaveDaemon},
        {"feed", feedChild},
        {"stay", [](Text) { return outliveParent(); }},
        {"kill-parent", [](Text) { return killParent(); }},
        {"garbage", [](Text) { return writeEverywhere(); }},
        {"close-all", [](Text) { return closeEverything(); }},
        {"late-fault", faultLater},
        {"thread", leaveThreadRunning}};
    const auto effect = effects.find(kind);
    return effect != effects.end() && effect->second(value);
}
