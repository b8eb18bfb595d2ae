#include "Core/BaseLib/ManualResetEvent.h"
#include "Core/BaseLib/TerminationRequest.h"
#include "Core/BaseLib/ThreadCount.h"

#include <future>
#include <vector>

#include <gtest/gtest.h>

using std::chrono::milliseconds;
using std::chrono::steady_clock;

namespace {
constexpr milliseconds kAtOnce(0);
constexpr milliseconds kLong(20000); // ends only a failing test
} // namespace

TEST(ManualResetEvent, StaysSetForEveryWaiterUntilReset)
{
    ManualResetEvent event;
    EXPECT_FALSE(event.waitFor(kAtOnce));
    std::vector<std::future<bool>> waiters;
    for (int number = 0; number < 3; ++number)
        waiters.push_back(std::async(std::launch::async, [&event] { return event.waitFor(kLong); }));
    event.set();
    for (std::future<bool> &waiter : waiters)
        EXPECT_TRUE(waiter.get());
    EXPECT_TRUE(event.isSet());
    event.reset();
    EXPECT_FALSE(event.isSet());
}

TEST(ThreadCount, SeesAThreadThatIsLeftBehind)
{
    const std::set<int> before = runningThreads();
    ManualResetEvent mayEnd;
    std::thread left([&mayEnd] { mayEnd.waitFor(kLong); });
    EXPECT_EQ(runningThreads().size(), before.size() + 1);
    EXPECT_FALSE(newThreadsEnd(before, kAtOnce));
    mayEnd.set();
    left.join();
    EXPECT_TRUE(newThreadsEnd(before, kLong));
}

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
