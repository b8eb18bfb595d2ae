#include "Tests/Main/AudioEngineController/Effects/VST/VSTScanBench.h"
#include "Tests/Support/PlatformValues.h"

#include <QDir>
#include <QFile>

namespace {

using VSTScan = VSTScanBench;

} // namespace

TEST_F(VSTScan, OrderOfTheCallsOfAProbe)
{
    const std::pair<const char *, const char *> rows[] = {
        {"", "get-plug-category; get-effect-name; get-plug-category; get-vendor-string"},
        {"inputs 0\n", "get-vendor-string"},
        {"category 2\n", "get-plug-category; get-plug-category; get-vendor-string"}};
    for (const auto &[script, calls] : rows) {
        update("Comp", script);
        scan();
        EXPECT_EQ(traceOf("Comp").join("; ").remove(" Comp"),
                  QLatin1String("static-constructor; entry; ") + calls + "; close; static-destructor");
        ASSERT_TRUE(QFile::remove(m_folder.path("Effects/FXConfiguration.xml")));
    }
}

TEST_F(VSTScan, WhatIsRecorded)
{
    add("A", "name \"R\\xF6hre\"\nvendor \"\\xDFound\"\nid 77\ncategory 3\noutputs 6\n");
    add("B.x64", "inputs 0\noutputs 2147483647\nid -1\nname unasked\n");
    add("C", "outputs -5\nname \"\"\nanswer get-effect-name 0\n");
    add("D", {}, VST2Fixture::Main);
    add("E", {}, VST2Fixture::Both);
    scan();
    EXPECT_EQ(records("Name ID Vendor Category Width Enabled Working"),
              texts({"B|B:-1|Fixture Works|2|2147483647|1|1", "C|C:1000|Fixture Works|1|-5|1|1",
                     "D|D:1000|Fixture Works|1|2|1|1", "E|E:1000|Fixture Works|1|2|1|1",
                     "Röhre|Röhre:77|ßound|3|6|1|1"}));
    expectSettled();
}

TEST_F(VSTScan, FilesThatFailAreRecordedAndFilesThatAreNoPluginsAreNot)
{
    add("Healthy");
    add("Null", "answer entry null\n");
    add("Wild", "answer entry no-memory\n");
    add("NoEntry", {}, VST2Fixture::NoEntry);
    addRaw("Text", "hello\n");
    addRaw("Empty", "");
    const QString log = scan().log;
    EXPECT_EQ(records("Name ID Enabled Working"),
              texts({"Empty|Empty|1|0", "Healthy|Healthy:1000|1|1", "Null|Null|1|0", "Wild|Wild|1|0"}));
    for (const QString &reason :
         {modulePath("Text") + ": it is not a program library", modulePath("Empty") + ": it is empty",
          modulePath("Wild") + ": its entry point returned something"})
        EXPECT_TRUE(log.contains(reason)) << qPrintable(log);
    expectSettled();
}

TEST_F(VSTScan, MarksSurviveAnUpdate)
{
    for (const char *name : {"A", "B", "C"})
        add(name);
    scan();
    mark("A", "Favourite", "1");
    mark("A", "CategoryMask", "16");
    mark("B", "Enabled", "0");
    for (const char *name : {"A", "B"})
        update(name, "vendor New\n");
    scan();
    EXPECT_EQ(loaded(), QStringList("A")) << "what is switched off is not probed";
    EXPECT_EQ(records("Name Vendor CategoryMask Favourite Enabled Working"),
              texts({"A|New|16|1|1|1", "B|Fixture Works|0|0|0|1", "C|Fixture Works|0|0|1|1"}));
    // Moved, the file is probed again with its marks, also the switch-off.
    ASSERT_TRUE(QDir(m_folder.plugins()).mkdir("sub"));
    ASSERT_TRUE(QFile::rename(modulePath("B"), modulePath("sub/B")));
    ASSERT_TRUE(QFile::remove(modulePath("C")));
    scan();
    EXPECT_EQ(records("Name Enabled"), texts({"A|1", "B|0"}));
    expectSettled();
}

TEST_F(VSTScan, FilesOfOneNameAreToldApartByTheirPaths)
{
    add("one/Comp", "name One\n");
    add("two/Comp", "name Two\n");
    add("three/Comp_64", "name One\nid 3\n");
    scan();
    EXPECT_EQ(records("Name ID"), texts({"One|One:1000", "Comp|One:3", "Two|Two:1000"}));
    update("two/Comp", "name Two\nvendor New\n");
    scan();
    EXPECT_EQ(loaded(), QStringList("Comp"));
    expectSettled();
}

TEST_F(VSTScan, WhatAPluginChangesIsPutBack)
{
    // The mask comes first: the catalogue keeps the permissions that it was made with.
    const QByteArray locale = QByteArray("locale ") + kForeignLocale;
    int number = 0;
    for (const QByteArray &effect :
         {QByteArray("umask 077"), locale, QByteArray("chdir /"), QByteArray("rounding up"),
          QByteArray("signal segv"), QByteArray("signal term"), QByteArray("alarm 1"),
          QByteArray("repair keep")})
        for (const char *stage : {"entry", "get-vendor-string"}) {
            const QByteArray id = QByteArray::number(++number);
            add("Spoiler " + id, QByteArray("effect ") + stage + ' ' + effect + "\nid " + id + '\n');
        }
    add("Thread", "effect entry thread\n");
    add("Zealous", "own-thread\nask-host entry 1 from-thread\nask-host get-vendor-string 7 until-close\n");
    const ScannerOutcome outcome = scan();
    EXPECT_EQ(records("Working").count("1"), number + 2);
    EXPECT_TRUE(outcome.log.contains("Thread" + vst2Ending() + " left threads running and stays in memory"));
    EXPECT_TRUE(QFile::permissions(m_folder.path("Effects/FXConfiguration.xml")) & QFile::ReadOther);
    expectSettled();
}
