#include "Core/BaseLib/FaultGuard.h"

#include <csignal>
#include <cstdlib>
#include <functional>
#include <string>
#include <thread>

#include <gtest/gtest.h>

namespace {

// Faults are committed through volatile values, so that the compiler cannot see and remove them.
volatile int g_zero = 0;
volatile int g_seven = 7;
int *volatile g_nowhere = nullptr;

[[gnu::noinline]] int overflowStack(int depth)
{
    volatile char block[4096] = {};
    block[depth % 4096] = char(depth);
    return depth < 0 ? 0 : overflowStack(depth + 1) + block[0];
}

[[gnu::no_sanitize("all")]] void writeNowhere() { *g_nowhere = 1; }
[[gnu::no_sanitize("all")]] void divideByZero() { g_zero = g_seven / g_zero; }
void callNull() { reinterpret_cast<void (*)()>(g_nowhere)(); }

/// What came of a guarded call.
std::string outcome(const std::function<void()> &function)
{
    try {
        callGuarded([&] { function(); });
    } catch (const SEException &fault) {
        return fault.what();
    } catch (const std::exception &exception) {
        return std::string("exception ") + exception.what();
    } catch (int number) {
        return "int " + std::to_string(number);
    }
    return "returned";
}

} // namespace

TEST(FaultGuard, FaultsBecomeExceptionsAgainAndAgain)
{
    const struct {
        const char *name;
        void (*function)();
        const char *outcome;
    } rows[] = {
        {"access violation", writeNowhere, "SE Exception: Access Violation"},
        {"null call", callNull, "SE Exception: Access Violation"},
        {"illegal instruction", [] { __asm__ volatile("ud2"); }, "SE Exception: 0xC000001D"},
        {"integer division by zero", divideByZero, "SE Exception: 0xC0000094"},
        {"raised bus error", [] { raise(SIGBUS); }, "SE Exception: Access Violation"},
        {"standard exception", [] { throw std::runtime_error("x"); }, "exception x"},
        {"thrown integer", [] { throw 42; }, "int 42"},
        {"nothing", [] {}, "returned"},
    };
    for (int round = 0; round < 3; ++round)
        for (const auto &row : rows)
            EXPECT_EQ(outcome(row.function), row.outcome) << row.name << ", round " << round;
}

TEST(FaultGuard, StackOverflowIsCaughtOnAThreadAgainAndAgain)
{
    std::thread worker([] {
        for (int round = 0; round < 3; ++round)
            EXPECT_EQ(outcome([] { overflowStack(0); }), "SE Exception: Access Violation");
    });
    worker.join();
}

TEST(FaultGuard, GuardsNest)
{
    std::string inner;
    EXPECT_EQ(outcome([&] {
                  inner = outcome(writeNowhere);
                  divideByZero();
              }),
              "SE Exception: 0xC0000094");
    EXPECT_EQ(inner, "SE Exception: Access Violation");
}

TEST(FaultGuard, ResultsComeBack)
{
    EXPECT_EQ(callGuarded([] { return 17; }), 17);
}

TEST(FaultGuard, HandlersOfOthersAreReplacedBeforeEachCall)
{
    EXPECT_EQ(outcome([] {
                  std::signal(SIGSEGV, SIG_IGN);
                  stack_t none = {};
                  none.ss_flags = SS_DISABLE;
                  sigaltstack(&none, nullptr);
              }),
              "returned");
    std::thread worker(
        [] { EXPECT_EQ(outcome([] { overflowStack(0); }), "SE Exception: Access Violation"); });
    worker.join();
    EXPECT_EQ(outcome(writeNowhere), "SE Exception: Access Violation");
}

TEST(FaultGuardDeathTest, OutsideAGuardTheProcessDies)
{
    const auto die = [] {
        outcome(writeNowhere); // handlers are armed now
        writeNowhere();
    };
    EXPECT_EXIT(die(), ::testing::KilledBySignal(SIGSEGV), "");
}
