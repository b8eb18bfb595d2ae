#include "Core/BaseLib/Process/ManualResetEvent.h"
#include "Tests/Core/BaseLib/Process/GuardedOutcome.h"

#include <csignal>
#include <thread>

#include <gtest/gtest.h>

namespace {

volatile int g_zero = 0;

[[gnu::no_sanitize("all")]] void divideByZero() { g_zero = 7 / g_zero; }
void callNull() { reinterpret_cast<void (*)()>(g_nowhere)(); }

constexpr char kViolation[] = "SE Exception: Access Violation";

} // namespace

TEST(FaultGuard, FaultsBecomeExceptionsAgainAndAgain)
{
    const struct {
        const char *name;
        void (*function)();
        const char *outcome;
    } rows[] = {
        {"access violation", writeNowhere, kViolation},
        {"null call", callNull, kViolation},
        {"illegal instruction", [] { __asm__ volatile("ud2"); }, "SE Exception: 0xC000001D"},
        {"integer division by zero", divideByZero, "SE Exception: 0xC0000094"},
        {"standard exception", [] { throw std::runtime_error("x"); }, "exception x"},
        {"thrown integer", [] { throw 42; }, "int 42"},
        {"handler that others leave behind", [] { std::signal(SIGSEGV, SIG_IGN); }, "returned"},
        {"stack overflow", [] { overflowStack(0); }, kOverflowOutcome},
    };
    std::thread worker([&rows] { // whose stack is the smaller one
        for (int round = 0; round < 3; ++round)
            for (const auto &row : rows)
                EXPECT_EQ(outcome(row.function), row.outcome) << row.name << ", round " << round;
    });
    worker.join();
}

// The other thread's stack is the next one below.
TEST(FaultGuard, ContainsTheFirstStackOverflowOfAThreadWhateverTheFrames)
{
    int (*const recursions[])(int) = {overflowStack<256>, overflowStack<1024>, overflowStack<2048>,
                                      overflowStack<8192>, overflowStack<65536>};
    for (std::size_t row = 0; row < std::size(recursions); ++row) {
        std::string result = "the thread was ended";
        ManualResetEvent begun, ended;
        std::thread overflowing([&] {
            begun.waitFor(std::chrono::hours(1));
            result = outcome([&] { recursions[row](0); });
            ended.set();
        });
        std::thread([&] { begun.set(), ended.waitFor(std::chrono::hours(1)); }).join();
        overflowing.join();
        EXPECT_EQ(result, kOverflowOutcome) << "row " << row;
    }
}

TEST(FaultGuard, GuardsNestAndATranslatedCallLetsFaultsOut)
{
    std::string inner, translated = "not ended";
    const std::string outer = outcome([&] {
        inner = outcome(writeNowhere);
        try {
            callTranslated([] { divideByZero(); });
        } catch (...) {
            translated = "caught";
        }
    });
    EXPECT_EQ(inner, kViolation);
    EXPECT_EQ(outer, "SE Exception: 0xC0000094");
    EXPECT_EQ(translated, "not ended");
    EXPECT_EQ(callTranslated([] { return 17; }), 17);
}
