#include "Core/BaseLib/Process/KriticalSection.h"

#include "Tests/Support/CapturedLog.h"

#include <thread>

#include <gtest/gtest.h>

TEST(TAutoLockCS, KeepsThreadsApartUnlessTheSectionUsesNoLock)
{
    const CapturedLog log;
    KriticalSection section;
    int counter = 0;
    const auto count = [&] {
        for (int round = 0; round < 2000; ++round) {
            const TAutoLockCS outer(&section), inner(&section);
            const int seen = counter;
            std::this_thread::yield();
            counter = seen + 1;
        }
    };
    std::thread other(count);
    count();
    other.join();
    EXPECT_EQ(counter, 4000);
    {
        const TAutoLockCS unguarded(nullptr);
    }
    section.setUseLock(false);
    section.enter(); // which would keep the other thread waiting
    std::thread([&section] { const TAutoLockCS guard(&section); }).join();
    section.leave();
}
