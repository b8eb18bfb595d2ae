#include "Tests/Main/AudioEngineController/Effects/VST/VSTScanBench.h"

#include <QFile>

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
    for (const QString &name : {QString("Shell"), QString("WaveShell1-VST 9.3_x64")}) {
        SCOPED_TRACE(qPrintable(name));
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
        EXPECT_EQ(records("Name Enabled Working Favourite"),
                  texts({"One|1|1|1", "Three|0|1|0", "Two|1|1|0"}));
        QFile::remove(modulePath(name));
        QFile::remove(m_folder.path("Effects/FXConfiguration.xml"));
    }
}

TEST_F(VSTShell, ChildrenThatFailLeaveTheirSiblingsAlone)
{
    add("Shell", kThree + "answer entry null 2\nfault entry throw-std 0x80000003\n"
                          "child 4 Four\nfault get-vendor-string segv 4\nchild 5 Five\n");
    const ScannerOutcome outcome = scan();
    EXPECT_EQ(
        sortedRecords("Name ID Enabled Working"),
        texts({"Five|Five:5|1|1", "Four|Four:4|1|1", "One|One:1|1|1", "Three|Three|1|0", "Two|Two|1|0"}));
    EXPECT_EQ(outcome.log.count("VSTPlugin::Load - Failed to Load DLL: "), 2);
    expectSettled();
}

TEST_F(VSTShell, WhoDiesWhenTheShellIsUnloaded)
{
    add("A", kThree + "fault close kill 2\n");
    add("B", "child 11 Eleven\nchild 12 Twelve\n");
    EXPECT_EQ(scanUntilSettled(), 2);
    EXPECT_EQ(sortedRecords("Name Enabled Working"),
              texts({"Eleven|1|1", "One|1|1", "Three|1|1", "Twelve|1|1", "Two|0|0"}))
        << "the child that died in its own end";
    update("B", "child 11 Eleven\nchild 12 Twelve\nfault static-destructor kill\n");
    EXPECT_EQ(scanUntilSettled(), 2);
    EXPECT_EQ(records("Name Enabled Working").filter("B|0|0").size(), 1) << "the shell as a whole";
    expectSettled();
}

TEST_F(VSTShell, ListsThatLie)
{
    add("Twice", "child 1 A\nchild 2 B\nafter-children repeat\n");
    add("Childless", "category 10\n");
    scan();
    EXPECT_EQ(records("Name Working"), texts({"A|1", "B|1", "Childless|0"}));
    expectSettled();
    add("Endless", "child 1 First\nafter-children endless\n");
    EXPECT_TRUE(scan().log.contains("names more than 4096 sub-plug-ins"));
    EXPECT_EQ(records("Name").size(), 4096 + 3);
}

TEST_F(VSTShell, NamesThatAreNoFileNames)
{
    const QByteArray children = "child 1 Shell\nchild 2 \"../../Up\"\nchild 3 \"\"\nchild 4 \".hidden\"\n";
    add("Shell", children + "fault static-destructor kill\n");
    EXPECT_EQ(scanUntilSettled(), 2) << "the shell's own marker is there to the end";
    EXPECT_EQ(records("Name Enabled Working").filter("|0|0").size(), 1);
    for (const char *id : {"2", "3", "4"}) {
        const QString name = QStringLiteral("Child %1").arg(id);
        add(name, children + "fault entry kill " + id + '\n');
    }
    EXPECT_EQ(scanUntilSettled(), 4);
    EXPECT_EQ(m_folder.markers(), QStringList());
}
