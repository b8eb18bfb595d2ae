#include "Tests/Core/BaseLib/Process/FaultGuardTrials.h"

#include <csignal>
#include <thread>

#include <gtest/gtest.h>

using namespace FaultGuardTrials;

TEST(FaultGuardSignals, ARaisedBusErrorIsAnAccessViolation)
{
    EXPECT_EQ(outcome([] { raise(SIGBUS); }), "SE Exception: Access Violation");
}

TEST(FaultGuardSignals, HandlersOfOthersAreReplacedBeforeEachCall)
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
