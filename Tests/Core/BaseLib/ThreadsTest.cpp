#include "Core/BaseLib/ManualResetEvent.h"
#include "Core/BaseLib/TerminationRequest.h"

#include <vector>

#include <gtest/gtest.h>

using std::chrono::milliseconds;
using std::chrono::steady_clock;

namespace {
constexpr milliseconds kAtOnce(0);
constexpr milliseconds kLong(20000); // ends only a failing test
} // namespace

TEST(TerminationWatcher, AsksOnceAndThenRemindsAfterTheGrace)
{
    constexpr milliseconds kGrace(120);
    int requested = 0;
    std::vector<steady_clock::duration> overdue; // counted from the request
    steady_clock::time_point start;
    ManualResetEvent reminded;
    const auto onRequest = [&] {
        ++requested;
        start = steady_clock::now();
    };
    const auto onOverdue = [&] {
        overdue.push_back(steady_clock::now() - start);
        if (overdue.size() == 3)
            reminded.set();
    };
    {
        const TerminationWatcher unasked(onRequest, onOverdue, kAtOnce);
    }
    EXPECT_EQ(requested, 0);
    {
        const TerminationWatcher watcher(onRequest, onOverdue, kGrace);
        TerminationSignal::raise();
        EXPECT_TRUE(reminded.waitFor(kLong));
    }
    EXPECT_EQ(requested, 1);
    EXPECT_GE(overdue.front(), kGrace);
}
