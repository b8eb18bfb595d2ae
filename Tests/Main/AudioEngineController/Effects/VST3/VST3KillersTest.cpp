#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

namespace {

using VST3Killers = VST3ScanBench;

} // namespace

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
