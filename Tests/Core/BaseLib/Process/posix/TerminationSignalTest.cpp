#include "Core/BaseLib/Process/TerminationRequest.h"

#include <csignal>

#include <gtest/gtest.h>

TEST(TerminationSignal, IsToldOnceAndNotAtAllWhereItIsIgnored)
{
    constexpr std::chrono::milliseconds kAtOnce(0);
    for (const int number : {SIGTERM, SIGINT, SIGHUP}) {
        const auto before = std::signal(number, SIG_DFL);
        TerminationSignal::install();
        std::raise(number);
        EXPECT_TRUE(TerminationSignal::wait(kAtOnce)) << number;
        EXPECT_FALSE(TerminationSignal::wait(kAtOnce)) << number;
        std::signal(number, SIG_IGN); // as nohup leaves it
        TerminationSignal::install();
        std::raise(number);
        EXPECT_FALSE(TerminationSignal::wait(kAtOnce)) << number;
        std::signal(number, before);
    }
}
