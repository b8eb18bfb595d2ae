#include "Tests/Core/BaseLib/Process/FaultGuardTrials.h"

#include <csignal>
#include <thread>

#include <gtest/gtest.h>

using namespace FaultGuardTrials;

namespace {

[[gnu::no_sanitize("all")]] void divideByZero() { g_zero = g_seven / g_zero; }
void callNull() { reinterpret_cast<void (*)()>(g_nowhere)(); }

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
            EXPECT_EQ(outcome([] { overflowStack(0); }), kOverflowOutcome);
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

TEST(FaultGuard, ATranslatedCallLetsFaultsOutToTheGuardAround)
{
    std::string inner = "not ended";
    EXPECT_EQ(outcome([&] {
                  try {
                      callTranslated([] { writeNowhere(); });
                  } catch (...) {
                      inner = "caught";
                  }
              }),
              "SE Exception: Access Violation");
    EXPECT_EQ(inner, "not ended");
    EXPECT_EQ(callTranslated([] { return 17; }), 17);
}

TEST(FaultGuardDeathTest, OutsideAGuardTheProcessDies)
{
    const auto die = [] {
        outcome(writeNowhere); // handlers are armed now
        writeNowhere();
    };
    EXPECT_DEATH(die(), "");
}
