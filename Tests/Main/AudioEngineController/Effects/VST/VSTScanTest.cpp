#include "Tests/Support/PlatformValues.h"
#include "Tests/Support/ScanBench.h"
#include "Tests/Support/VST2Fixture.h"

#include <QFile>

namespace {

const QByteArray kThree = "child 1 One\nchild 2 Two\nchild 0x80000003 Three\n";

class VSTScan : public ScanBench {
protected:
    VSTScan()
        : ScanBench("FXConfiguration.xml", vst2Ending())
    {}
};

} // namespace

TEST_F(VSTScan, FilesThatFailAreRecordedAndFilesThatAreNoPluginsAreNot)
{
    put("Healthy.vst2");
    put("Wild.vst2", "answer entry no-memory\n");
    put("Childless.vst2", "category 10\n");
    addVST2File(m_folder.plugins(), "NoEntry", {}, VST2Fixture::NoEntry);
    m_folder.write(modulePath("Text"), "hello\n");
    m_folder.write(modulePath("Empty"), "");
    const QString log = scan().log;
    EXPECT_EQ(records("Name ID Enabled Working"), texts({"Childless|Childless|1|0", "Empty|Empty|1|0",
                                                         "Healthy|Healthy:1000|1|1", "Wild|Wild|1|0"}));
    for (const QString &reason :
         {modulePath("Text") + ": it is not a program library", modulePath("Empty") + ": it is empty",
          modulePath("Wild") + ": its entry point returned something"})
        EXPECT_TRUE(log.contains(reason)) << qPrintable(log);
    expectSettled();
}

TEST_F(VSTScan, WhatAPluginChangesIsPutBack)
{
    // The mask comes first: the catalogue keeps the permissions that it was made with.
    const QByteArray locale = QByteArray("locale ") + kForeignLocale;
    int number = 0;
    for (const char *effect :
         {"umask 077", locale.constData(), "chdir /", "rounding up", "signal segv", "signal term", "alarm 1"})
        for (const char *stage : {"entry", "get-vendor-string"}) {
            const QByteArray id = QByteArray::number(++number);
            put("Spoiler " + id + ".vst2", QByteArray("effect ") + stage + ' ' + effect + "\nid " + id);
        }
    put("Thread.vst2", "effect entry thread\n");
    put("Handler.vst2", "effect get-effect-name signal segv\nfault get-vendor-string segv\n");
    put("Zealous.vst2",
        "own-thread\nask-host entry 1 from-thread\nask-host get-vendor-string 7 until-close\n");
    const ScannerOutcome outcome = scan();
    EXPECT_EQ(records("Working").count("1"), number + 3);
    EXPECT_TRUE(outcome.log.contains("Thread" + vst2Ending() + " left threads running and stays in memory"));
    EXPECT_TRUE(QFile::permissions(cataloguePath()) & QFile::ReadOther);
    expectSettled();
}

TEST_F(VSTScan, EveryChildOfAShellIsListedAndEveryEffectClosed)
{
    put("Shell.vst2", kThree);
    put("Twice.vst2", "child 1 A\nchild 2 B\nanswer entry null 2\nafter-children repeat\n");
    scan();
    EXPECT_EQ(records("Name ID Working"),
              texts({"A|A:1|1", "B|B|0", "One|One:1|1", "Three|Three:-2147483645|1", "Two|Two:2|1"}));
    const QByteArray text = m_folder.catalogue("FXConfiguration.xml").replace("\r\n", "\n");
    EXPECT_TRUE(text.contains(
        "\t\t<SubEffect>\n\t\t\t<Name>Three</Name>\n\t\t\t<ID>2147483651</ID>\n\t\t</SubEffect>\n"));
    const QStringList calls = traceOf("Shell");
    EXPECT_EQ(calls.filter("close"), texts({"close Three", "close Two", "close One", "close Shell"}));
    EXPECT_EQ(calls.last(), "static-destructor");
    EXPECT_EQ(calls.filter("static-constructor").size(), 1) << "loaded once";
    expectSettled();
}

TEST_F(VSTScan, ADeadlyChildDisablesOnlyItself)
{
    const char *const name = "WaveShell1-VST 9.3_x64.vst2"; // no exception for those
    put(name, kThree + "fault entry kill 2\n");
    EXPECT_EQ(scanUntilSettled(), 2);
    EXPECT_EQ(records("Name ID Enabled Working"),
              texts({"One|One:1|1|1", "Three|Three:-2147483645|1|1", "Two|Two|0|0"}));
    expectSettled();
    // Another version of the file gives it another chance.
    mark("One", "Favourite", "1");
    mark("Three", "Enabled", "0");
    dateLater(put(name, kThree));
    scan();
    EXPECT_EQ(records("Name Enabled Working Favourite"), texts({"One|1|1|1", "Three|0|1|0", "Two|1|1|0"}));
}

TEST_F(VSTScan, AChildOfTheShellsNameLeavesTheShellsMarkerAlone)
{
    put("Shell.vst2", "child 1 Shell\nchild 2 \"../../Up\"\nfault static-destructor kill\n");
    EXPECT_EQ(scanUntilSettled(), 2);
    EXPECT_EQ(records("Enabled Working").count("0|0"), 1);
}
