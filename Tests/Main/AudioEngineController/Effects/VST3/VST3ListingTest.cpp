#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QElapsedTimer>

namespace {

using VST3Listing = VST3ScanBench;

} // namespace

TEST_F(VST3Listing, AHealthyModuleGivesThisCatalogue)
{
    const QByteArray path = add("Comp x64", "factory-vendor \"Fixture & Co\"\n"
                                            "class \"Comp, große\"\n"
                                            "id 00112233445566778899AABBCCDDEEFF\n"
                                            "subcategories Fx|Dynamics|Mastering\n"
                                            "inputs 2 1:aux\noutputs 6\n")
                                .toUtf8();
    scan();
    const QByteArray expected = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                                "<Effects version=\"1.1\">\n"
                                "\t<Effect>\n"
                                "\t\t<Path>" +
                                path +
                                "</Path>\n"
                                "\t\t<FileTime>2021-03-04 05:06</FileTime>\n"
                                "\t\t<Name>Comp, große</Name>\n"
                                "\t\t<ID>00112233445566778899AABBCCDDEEFF</ID>\n"
                                "\t\t<Categories>Fx|Dynamics|Mastering</Categories>\n"
                                "\t\t<CategoryMask>264</CategoryMask>\n"
                                "\t\t<Favourite>0</Favourite>\n"
                                "\t\t<Vendor>Fixture & Co</Vendor>\n"
                                "\t\t<Inputs>2</Inputs>\n"
                                "\t\t<Outputs>2</Outputs>\n"
                                "\t\t<Enabled>1</Enabled>\n"
                                "\t\t<Working>1</Working>\n"
                                "\t</Effect>\n"
                                "</Effects>\n";
    EXPECT_EQ(m_folder.catalogue().replace("\r\n", "\n"), expected);
}

TEST_F(VST3Listing, TextsComeAsTheFactoryGivesThem)
{
    const QByteArray longName(64, 'n');
    const struct {
        const char *row;
        QByteArray script;
        QByteArray expected; // Name|Vendor|Categories
    } cases[] = {
        {"class vendor", "class cv\nvendor \"Class Maker\"\n", "cv|Class Maker|Fx"},
        {"no vendor at all", "factory-vendor \"\"\nclass nv\n", "nv||Fx"},
        {"old factory", "generation 1\nclass old\nvendor Unasked\n", "old|Fixture Works|"},
        {"newer information refused", "class nir\nvendor V\nanswer class-info2 false\n",
         "nir|Fixture Works|"},
        {"Unicode information refused", "class uir\nvendor V\nanswer class-info-unicode false\n", "uir|V|Fx"},
        {"factory information refused", "class fir\nanswer factory-info false\n", "fir||Fx"},
        {"64 bytes, no terminator", "class " + longName + "\n", longName + "|Fixture Works|Fx"},
        {"vendor of 64 bytes", "class lv\nvendor " + longName + "v\n", "lv|" + longName + "|Fx"},
        {"sub-categories of 128 bytes", "class lc\nsubcategories " + longName + longName + "\n",
         "lc|Fixture Works|" + longName + longName},
        {"invalid UTF-8", "class \"a\\xFF\\xC3(b\"\nvendor \"\\x80\"\n", "a\uFFFD\uFFFD(b|\uFFFD|Fx"},
        {"a character cut by the field", "class \"" + longName.left(63) + "é\"\n",
         longName.left(63) + "\uFFFD|Fixture Works|Fx"},
        {"beyond 16 bits", "class \"🎛 リバーブ\"\n", "🎛 リバーブ|Fixture Works|Fx"},
        {"blanks", "class \" a  b \"\n", " a  b |Fixture Works|Fx"},
        {"nothing but a blank", "class \" \"\n", " |Fixture Works|Fx"},
        {"empty name", "class \"\"\n", "|Fixture Works|Fx"},
        {"signs", "class \"%s%n A & B\"\n", "%s%n A & B|Fixture Works|Fx"},
    };
    for (const auto &row : cases)
        add(row.row, row.script);
    scan();
    const QStringList found = records("Name Vendor Categories");
    EXPECT_EQ(found.size(), static_cast<int>(std::size(cases)));
    for (const auto &row : cases)
        EXPECT_TRUE(found.contains(row.expected)) << row.row;
    expectSettled();
}

TEST_F(VST3Listing, ClassesThatShareANameOrAnIdentifier)
{
    add("A twice",
        "class A\nid 0000000000000000000000000000000A\n"
        "class A\nid 0000000000000000000000000000000B\nclass After\nid 0000000000000000000000000000000C\n");
    add("B one id twice", "class B1\nid 000000000000000000000000000000B1\n"
                          "class B2\nid 000000000000000000000000000000B1\n");
    add("C x64", "class B1\nid 000000000000000000000000000000C1\n");
    add("D id", "class D\nid 000000000000000000000000000000C1\n");
    add("E zero id", "class Zero\nid 00000000000000000000000000000000\n");
    scan();
    EXPECT_EQ(records("Name ID"),
              texts({"Zero|00000000000000000000000000000000", "A|0000000000000000000000000000000A",
                     "After|0000000000000000000000000000000C", "B1|000000000000000000000000000000B1",
                     "C |000000000000000000000000000000C1"}));
    EXPECT_EQ(traceOf("A twice").filter("create-instance"),
              texts({"create-instance A", "create-instance After"}));
}

TEST_F(VST3Listing, ClassesThatFailOrAreNoneAreLeftOut)
{
    const char *failures[] = {"create-instance false",     "create-instance no-interface",
                              "create-instance null",      "create-instance 0x80004005",
                              "initialize internal-error", "initialize false"};
    QByteArray script = "class Refusing\nanswer class-info false Refusing\n";
    for (const char *category : {"Component Controller Class", "Audio Module Class 2", "Audio Module",
                                 "audio module class", "Audio Module Class and 32 bytes!!", ""})
        script += QByteArray("class \"of ") + category + "\"\ncategory \"" + category + "\"\n";
    for (const char *failure : failures)
        script += QByteArray("class \"") + failure + "\"\nanswer " + failure + " \"" + failure + "\"\n";
    add("Some", script + "class Last\nanswer terminate internal-error Last\n");
    const QString log = scan().log;
    EXPECT_EQ(records("Name Working"), texts({"Last|1"}));
    EXPECT_EQ(traceOf("Some").filter("class-info2 of"), QStringList()) << "not asked further";
    for (const char *failure : failures)
        EXPECT_TRUE(log.contains("its class \"" + QString(failure) + "\" could not be ")) << failure;
}

TEST_F(VST3Listing, StatedClassCountsAreNotBelieved)
{
    for (const char *count : {"2147483647", "1000", "-1", "-2147483648", "0"})
        add(count, QByteArray("answer count-classes ") + count + "\nclass \"" + count + " A\"\nclass \"" +
                       count + " B\"\n");
    QElapsedTimer clock;
    clock.start();
    scan();
    EXPECT_LT(clock.elapsed(), 10000) << "counted what is not there";
    EXPECT_EQ(sortedRecords("Name Working"), texts({"-1|0", "-2147483648|0", "0|0", "1000 A|1", "1000 B|1",
                                                    "2147483647 A|1", "2147483647 B|1"}));
}

// What the writer does not escape is kept as it is; of such a file the next run understands what crashed.
TEST_F(VST3Listing, ANameThatBreaksTheCatalogueCausesANewProbe)
{
    add("Broken", "class \"a < b\"\n");
    add("Comp");
    add("Killer", "class K\nfault initialize kill\n");
    scanUntilSettled();
    for (int run = 0; run < 2; ++run) {
        SCOPED_TRACE(run);
        EXPECT_TRUE(scan().log.contains("Cannot use the catalogue"));
        EXPECT_EQ(loaded(), texts({"Broken", "Comp"}));
        EXPECT_EQ(sortedRecords("Name Working"), texts({"Comp|1", "Killer|0", "a < b|1"}));
    }
}
