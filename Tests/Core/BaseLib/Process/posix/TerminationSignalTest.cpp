#include "Core/BaseLib/Process/TerminationRequest.h"

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

TEST(TerminationWatcher, LeavesNoRequestBehindForAnother)
{
    int requests = 0;
    const auto count = [&requests] { ++requests; };
    for (int round = 0; round < 100; ++round)
        const TerminationWatcher watcher(count, count, std::chrono::seconds(20));
    EXPECT_FALSE(TerminationSignal::wait(std::chrono::milliseconds(0)));
    EXPECT_EQ(requests, 0);
}
