#include "Core/BaseLib/Process/ProcessState.h"

#include "Tests/Core/BaseLib/Process/SpoiledState.h"

#include <gtest/gtest.h>

TEST(ProcessState, PutsBackWhatAPluginSpoils)
{
    prepareState();
    const std::string before = wholeState();
    const ProcessState state;
    EXPECT_EQ(wholeState(), before) << "taking the state changed it";
    for (const Spoiling &row : spoilings()) {
        row.spoil();
        EXPECT_NE(wholeState(), before) << row.name << " spoils nothing that this test sees";
        state.restore();
        EXPECT_EQ(wholeState(), before) << row.name;
    }
}
