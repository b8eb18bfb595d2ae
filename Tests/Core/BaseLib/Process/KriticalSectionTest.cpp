#include "Core/BaseLib/Process/KriticalSection.h"

#include "Core/BaseLib/Log/Assertion.h"
#include "Core/BaseLib/WorkstationServices/AudioPlugins.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"
#include "Tests/Support/CapturedLog.h"

#include <future>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

TEST(TAutoLockCS, NullSectionIsReportedAndTheScopeRuns)
{
    const CapturedLog log;
    const QtMessages messages;
    bool ran = false;
    {
        const TAutoLockCS guard(nullptr);
        ran = true;
    }
    EXPECT_TRUE(ran);
    EXPECT_EQ(log.lines(), QStringList("Assertion failed: \"0\", Core/BaseLib/KriticalSection, line 194"_q));
    EXPECT_EQ(messages.lines(), QStringList(" TAutoLockCS given a null pointer\n"_q));
}

TEST(TAutoLockCS, TakesNoLockWhenTheSectionUsesNone)
{
    KriticalSection section;
    section.setUseLock(false);
    section.enter();
    auto passed = std::async(std::launch::async, [&section] { const TAutoLockCS guard(&section); });
    EXPECT_EQ(passed.wait_for(std::chrono::seconds(20)), std::future_status::ready);
    section.leave();
}

TEST(TAutoLockCS, KeepsThreadsApartAndLetsItsOwnThreadInAgain)
{
    constexpr int kRounds = 2000;
    KriticalSection section;
    int counter = 0;
    std::vector<std::thread> threads;
    for (int number = 0; number < 4; ++number)
        threads.emplace_back([&] {
            for (int round = 0; round < kRounds; ++round) {
                const TAutoLockCS outer(&section);
                const TAutoLockCS inner(&section);
                const int seen = counter;
                std::this_thread::yield();
                counter = seen + 1;
            }
        });
    for (std::thread &thread : threads)
        thread.join();
    EXPECT_EQ(counter, 4 * kRounds);
}

TEST(Assertion, NamesThePlaceInsideTheSourceTreeAndGoesOn)
{
    const CapturedLog log;
    EXPECT_TRUE(FXPROBE_VERIFY(1 == 1));
    EXPECT_FALSE(FXPROBE_VERIFY(1 == 2));
    EXPECT_TRUE(log.lines().first().startsWith(
        "Assertion failed: \"1 == 2\", Tests/Core/BaseLib/KriticalSectionTest.cpp, line "_q));
    EXPECT_EQ(AudioPlugins::registry(), nullptr);
    EXPECT_EQ(log.lines().last(), "Assertion failed: \"0 != _this\", Core/BaseLib/AudioPlugins, line 24"_q);
}
