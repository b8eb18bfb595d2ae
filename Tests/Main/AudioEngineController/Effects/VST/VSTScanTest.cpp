#include "Tests/Main/AudioEngineController/Effects/VST/VSTScanBench.h"
#include "Tests/Support/PlatformValues.h"

#include <QDir>
#include <QFile>

namespace {

class VSTScan : public VSTScanBench {};

} // namespace

TEST_F(VSTScan, OrderOfTheCallsOfAProbe)
{
    add(QStringLiteral("Effect"));
    add(QStringLiteral("Synth"), "inputs 0\n");
    add(QStringLiteral("Instrument"), "category 2\n");
    scan();
    EXPECT_EQ(
        traceOf(QStringLiteral("Effect")),
        texts({"static-constructor", "entry Effect", "get-plug-category Effect", "get-effect-name Effect",
               "get-plug-category Effect", "get-vendor-string Effect", "close Effect", "static-destructor"}));
    EXPECT_EQ(traceOf(QStringLiteral("Synth")),
              texts({"static-constructor", "entry Synth", "get-vendor-string Synth", "close Synth",
                     "static-destructor"}));
    EXPECT_EQ(traceOf(QStringLiteral("Instrument")),
              texts({"static-constructor", "entry Instrument", "get-plug-category Instrument",
                     "get-plug-category Instrument", "get-vendor-string Instrument", "close Instrument",
                     "static-destructor"}));
}

TEST_F(VSTScan, WhatIsRecorded)
{
    add(QStringLiteral("A"), "name \"R\\xF6hre\"\nvendor \"\\xDFound\"\nid 77\ncategory 3\noutputs 6\n");
    add(QStringLiteral("B.x64"), "inputs 0\noutputs 2147483647\nid -1\nname unasked\n");
    add(QStringLiteral("C"), "outputs -5\nname \"\"\nanswer get-effect-name 0\n");
    add(QStringLiteral("D"), {}, VST2Fixture::Main);
    add(QStringLiteral("E"), {}, VST2Fixture::Both);
    scan();
    EXPECT_EQ(records("Name ID Vendor Category Width Enabled Working"),
              texts({"B|B:-1|Fixture Works|2|2147483647|1|1", "C|C:1000|Fixture Works|1|-5|1|1",
                     "D|D:1000|Fixture Works|1|2|1|1", "E|E:1000|Fixture Works|1|2|1|1",
                     "Röhre|Röhre:77|ßound|3|6|1|1"}));
    expectSettled();
}

TEST_F(VSTScan, FilesThatFailAreRecordedAndFilesThatAreNoPluginsAreNot)
{
    add(QStringLiteral("Healthy"));
    add(QStringLiteral("Null"), "answer entry null\n");
    add(QStringLiteral("Wild"), "answer entry no-memory\n");
    add(QStringLiteral("Magic"), "magic 7\n");
    add(QStringLiteral("Thrown"), "fault entry throw-int\n");
    add(QStringLiteral("NoEntry"), {}, VST2Fixture::NoEntry);
    addRaw(QStringLiteral("Text"), "hello\n");
    addRaw(QStringLiteral("Empty"), "");
    const ScannerOutcome outcome = scan();
    EXPECT_EQ(records("Name ID Enabled Working"),
              texts({"Empty|Empty|1|0", "Healthy|Healthy:1000|1|1", "Magic|Magic|1|0", "Null|Null|1|0",
                     "Text|Text|1|0", "Thrown|Thrown|1|0", "Wild|Wild|1|0"}));
    for (const QString &reason :
         {QString::fromLatin1(kTextFileReason), modulePath(QStringLiteral("Empty")) + QStringLiteral(": "),
          modulePath(QStringLiteral("Magic")) + QStringLiteral(", Didn't manage it")})
        EXPECT_TRUE(outcome.log.contains(reason)) << qPrintable(reason + QLatin1Char('\n') + outcome.log);
    expectSettled();
}

TEST_F(VSTScan, MarksSurviveAnUpdate)
{
    for (const char *name : {"A", "B", "C"})
        add(QString::fromLatin1(name));
    scan();
    mark(QStringLiteral("A"), "Favourite", "1");
    mark(QStringLiteral("A"), "CategoryMask", "16");
    mark(QStringLiteral("B"), "Enabled", "0");
    for (const char *name : {"A", "B"})
        update(QString::fromLatin1(name), "vendor New\n");
    scan();
    EXPECT_EQ(loaded(), QStringList(QStringLiteral("A"))) << "what is switched off is not probed";
    EXPECT_EQ(records("Name Vendor CategoryMask Favourite Enabled Working"),
              texts({"A|New|16|1|1|1", "B|Fixture Works|0|0|0|1", "C|Fixture Works|0|0|1|1"}));
    // Moved, the file is probed again with its marks, also the switch-off.
    const QString moved = m_folder.plugins() + QStringLiteral("/sub");
    ASSERT_TRUE(QDir().mkpath(moved));
    ASSERT_TRUE(QFile::rename(modulePath(QStringLiteral("B")), moved + QStringLiteral("/B") + vst2Ending()));
    ASSERT_TRUE(QFile::remove(modulePath(QStringLiteral("C"))));
    scan();
    EXPECT_EQ(records("Name Enabled"), texts({"A|1", "B|0"}));
    expectSettled();
}

TEST_F(VSTScan, FilesOfOneNameAreToldApartByTheirPaths)
{
    add(QStringLiteral("one/Comp"), "name One\n");
    add(QStringLiteral("two/Comp"), "name Two\n");
    add(QStringLiteral("three/Comp_64"), "name One\nid 3\n");
    scan();
    EXPECT_EQ(records("Name ID"), texts({"One|One:1000", "Comp|One:3", "Two|Two:1000"}));
    update(QStringLiteral("two/Comp"), "name Two\nvendor New\n");
    scan();
    EXPECT_EQ(loaded(), QStringList(QStringLiteral("Comp")));
    expectSettled();
}

TEST_F(VSTScan, WhatAPluginChangesIsPutBack)
{
    // The mask comes first: the catalogue keeps the permissions that it was made with.
    const QByteArray locale = QByteArray("locale ") + kForeignLocale;
    const QByteArray effects[] = {"umask 077",   locale,        "chdir /", "rounding up",
                                  "signal segv", "signal term", "alarm 1", "repair keep"};
    int number = 0;
    for (const QByteArray &effect : effects)
        for (const char *stage : {"entry", "get-vendor-string"}) {
            ++number;
            add(QStringLiteral("Spoiler %1").arg(number),
                QByteArray("effect ") + stage + ' ' + effect + "\nid " + QByteArray::number(number) + '\n');
        }
    add(QStringLiteral("Thread"), "effect entry thread\n");
    add(QStringLiteral("Zealous"), "own-thread\nask-host entry 1 from-thread\n"
                                   "ask-host get-vendor-string 7 until-close\n");
    const ScannerOutcome outcome = scan();
    EXPECT_EQ(records("Name").size(), number + 2);
    EXPECT_EQ(sortedRecords("Working"),
              QStringList(QVector<QString>(number + 2, QStringLiteral("1")).toList()));
    EXPECT_TRUE(outcome.log.contains(QStringLiteral("Thread") + vst2Ending() +
                                     QStringLiteral(" left threads running and stays in memory")));
    const QString catalogue = m_folder.path(QStringLiteral("Effects/FXConfiguration.xml"));
    EXPECT_TRUE(QFile::permissions(catalogue) & QFile::ReadOther);
    expectSettled();
}

TEST_F(VSTScan, AfterAFaultNothingIsClosedOrUnloaded)
{
    add(QStringLiteral("Fault"), "fault get-vendor-string segv\n");
    add(QStringLiteral("Throw"), "fault get-vendor-string throw-std\n");
    scan();
    EXPECT_EQ(traceOf(QStringLiteral("Fault")).last(), QStringLiteral("get-vendor-string Fault"));
    EXPECT_EQ(traceOf(QStringLiteral("Throw")).last(), QStringLiteral("static-destructor"));
}
