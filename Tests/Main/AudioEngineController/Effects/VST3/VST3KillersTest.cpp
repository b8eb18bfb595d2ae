#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

namespace {

using VST3Killers = VST3ScanBench;

} // namespace

TEST_F(VST3Killers, CrashesOfKnownPluginsKeepTheUsersMarks)
{
    add("Comp", "class First\nid 0000000000000000000000000000000A\n"
                "class Second\nid 0000000000000000000000000000000B\n");
    add("Other", "class Other\nid 0000000000000000000000000000000C\n");
    scan();
    for (const char *name : {"First", "Second"}) {
        mark(name, "Favourite", "1");
        mark(name, "CategoryMask", "16384");
    }
    update("Comp", "class First\nfault initialize segv\n");
    scanOnce();
    EXPECT_EQ(m_folder.markers(), texts({"Comp.scan3"}));
    const QStringList expected =
        texts({"Second|0000000000000000000000000000000B|2021-03-04 05:06|16384|1|1|1",
               "Other|0000000000000000000000000000000C|2021-03-04 05:06|0|0|1|1",
               "First|Comp|2022-03-04 05:06|16384|1|0|0"});
    for (int run = 0; run < 2; ++run) {
        scan();
        m_folder.setModified(modulePath("Comp"), QDateTime({2023, 4, 5}, {6, 7}));
        EXPECT_EQ(records("Name ID FileTime CategoryMask Favourite Enabled Working"), expected);
        EXPECT_EQ(loaded(), QStringList());
    }
}

TEST_F(VST3Killers, ACulpritWhoseNameAFailedFileHoldsIsKnownByItsPath)
{
    addRaw("a/Same", "no module");
    const QString culprit = add("b/Same", "fault initialize kill\nclass Same\n");
    add("c healthy");
    EXPECT_EQ(scanUntilSettled(), 2);
    EXPECT_EQ(sortedRecords("Name ID Enabled Working").mid(0, 2),
              QStringList({"Same|" + culprit + "|0|0", "Same|Same|1|0"}));
    expectSettled();
}

TEST_F(VST3Killers, ACrashedWaveShellIsLeftAloneForOneRun)
{
    add("WaveShell1", "class W\nfault initialize kill\n");
    add("a Healthy");
    scanOnce();
    EXPECT_EQ(m_folder.markers(), texts({"WaveShell1.scan3"}));
    scan();
    EXPECT_EQ(loaded(), QStringList());
    EXPECT_EQ(records("Name"), texts({"a Healthy"}));
    scanOnce();
    EXPECT_EQ(loaded(), texts({"WaveShell1"}));
    EXPECT_EQ(m_folder.markers(), texts({"WaveShell1.scan3"}));
    add("WaveShell1", "class W\n");
    scan();
    scan();
    EXPECT_EQ(sortedRecords("Name Enabled Working"), texts({"W|1|1", "a Healthy|1|1"}));
}
