#include "Core/BaseLib/TerminationRequest.h"

#include <csignal>
#include <cstring>

#include <unistd.h>

#include <gtest/gtest.h>

TEST(TerminationSignal, ToldOnceForEachSignalAndNeverForAnIgnoredOne)
{
    constexpr std::chrono::milliseconds kAtOnce(0);
    constexpr std::chrono::milliseconds kLong(20000); // ends only a failing test
    for (const int number : {SIGTERM, SIGINT, SIGHUP}) {
        const auto before = std::signal(number, SIG_DFL);
        TerminationSignal::install();
        kill(getpid(), number);
        EXPECT_TRUE(TerminationSignal::wait(kLong)) << strsignal(number);
        EXPECT_FALSE(TerminationSignal::wait(kAtOnce)) << strsignal(number);
        std::signal(number, SIG_IGN);
        TerminationSignal::install();
        kill(getpid(), number);
        EXPECT_FALSE(TerminationSignal::wait(kAtOnce)) << strsignal(number);
        EXPECT_EQ(std::signal(number, before), SIG_IGN) << strsignal(number);
    }
}
