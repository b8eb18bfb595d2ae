#include "Core/BaseLib/DebugLog.h"

#include "Tests/Support/CapturedLog.h"

#include <gtest/gtest.h>

TEST(DebugLog, PercentSignsBecomeAsterisks)
{
    const CapturedLog log;
    DebugLog(L"%ls is %d%% done", QStringLiteral("100% Fuzz"), 5);
    EXPECT_EQ(log.lines(), QStringList(QStringLiteral("100* Fuzz is 5* done")));
}
