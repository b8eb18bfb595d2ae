#include "Tests/Main/AudioEngineController/Effects/VST/VSTScanBench.h"

namespace {

using VSTShell = VSTScanBench;

const QByteArray kThree = "child 1 One\nchild 2 Two\nchild 0x80000003 Three\n";

} // namespace

TEST_F(VSTShell, EveryChildIsListedAndEveryEffectClosed)
{
    add("Shell", kThree);
    scan();
    EXPECT_EQ(records("Name ID Working"), texts({"One|One:1|1", "Three|Three:-2147483645|1", "Two|Two:2|1"}));
    const QByteArray text = m_folder.catalogue("FXConfiguration.xml").replace("\r\n", "\n");
    EXPECT_TRUE(text.contains(
        "\t\t<SubEffect>\n\t\t\t<Name>Three</Name>\n\t\t\t<ID>2147483651</ID>\n\t\t</SubEffect>\n"));
    const QStringList calls = traceOf("Shell");
    EXPECT_EQ(calls.filter("close"), texts({"close Three", "close Two", "close One", "close Shell"}));
    EXPECT_EQ(calls.last(), "static-destructor");
    EXPECT_EQ(calls.filter("static-constructor").size(), 1) << "loaded once";
    expectSettled();
}

TEST_F(VSTShell, ADeadlyChildDisablesOnlyItself)
{
    const QString name = "WaveShell1-VST 9.3_x64"; // no exception for those
    add(name, kThree + "fault entry kill 2\n");
    EXPECT_EQ(scanUntilSettled(), 2);
    EXPECT_EQ(records("Name ID Enabled Working"),
              texts({"One|One:1|1|1", "Three|Three:-2147483645|1|1", "Two|Two|0|0"}));
    expectSettled();
    // Another version of the file gives it another chance.
    mark("One", "Favourite", "1");
    mark("Three", "Enabled", "0");
    update(name, kThree);
    scan();
    EXPECT_EQ(records("Name Enabled Working Favourite"), texts({"One|1|1|1", "Three|0|1|0", "Two|1|1|0"}));
}

TEST_F(VSTShell, ListsThatLie)
{
    add("Twice", "child 1 A\nchild 2 B\nanswer entry null 2\nafter-children repeat\n");
    add("Childless", "category 10\n");
    scan();
    EXPECT_EQ(records("Name Working"), texts({"A|1", "B|0", "Childless|0"}));
    expectSettled();
    add("Endless", "child 1 First\nafter-children endless\n");
    EXPECT_TRUE(scan().log.contains("names more than 4096 sub-plug-ins"));
    EXPECT_EQ(records("Name").size(), 4096 + 3);
}

TEST_F(VSTShell, AChildOfTheShellsNameLeavesTheShellsMarkerAlone)
{
    add("Shell", "child 1 Shell\nchild 2 \"../../Up\"\nfault static-destructor kill\n");
    EXPECT_EQ(scanUntilSettled(), 2);
    EXPECT_EQ(records("Enabled Working").count("0|0"), 1);
}
