#include "Main/VLib/StatusHandover.h"

#include <gtest/gtest.h>

#include <thread>

namespace {
constexpr int kRounds = 20000;
}

// Meant for the thread sanitizer above all.
TEST(StatusHandover, TextAndRangeStayTogetherAcrossThreads)
{
    StatusHandover status;
    std::thread scan([&status] {
        for (int round = 1; round <= kRounds; ++round) {
            status.setRange(0, round, QString::number(round));
            status.setValue(round);
            status.requestShow();
        }
        status.setFinished();
    });
    int shows = 0;
    int last = 0;
    for (bool finished = false; !finished;) {
        finished = status.isFinished();
        const PendingStatus taken = status.take();
        shows += status.takeShowRequest() ? 1 : 0;
        ASSERT_EQ(taken.text.toInt(), taken.maximum);
        last = qMax(last, taken.value);
    }
    scan.join();
    EXPECT_EQ(last, kRounds);
    EXPECT_EQ(shows, 1);
}
