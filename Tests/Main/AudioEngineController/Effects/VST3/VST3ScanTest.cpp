#include "Tests/Support/ScanBench.h"
#include "Tests/Support/PlatformValues.h"
#include "Tests/Support/VST3Fixture.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

namespace {

const QByteArray kIdA = "id 0000000000000000000000000000000A\n";

/// The bench with VST 3 modules on it.
class VST3ScanTest : public ScanBench {
protected:
    VST3ScanTest()
        : ScanBench("VST3Configuration.xml", ".vst3")
    {}

    /// Puts a module into "Plugins", or a folder below it ("sub/Comp"). Without a script it has one healthy
    /// class of its own name.
    QString add(const QString &name, const QByteArray &script = {}) const
    {
        return dateFirst(addVST3File(m_folder.plugins(), name, scriptOf(name, script)));
    }
    QString addBundle(const QString &name) const
    {
        const QString bundle = addVST3Bundle(m_folder.plugins(), name, scriptOf(name, {}));
        dateFirst(vst3BundleBinary(bundle));
        return bundle;
    }
    /// Replaces a module by one of a later date.
    void update(const QString &name, const QByteArray &script) const { dateLater(add(name, script)); }

private:
    QByteArray scriptOf(const QString &name, const QByteArray &script) const
    {
        const QByteArray label = QFileInfo(name).fileName().toUtf8();
        return traceStatement(name) + (script.isNull() ? "class \"" + label + "\"\n" : script);
    }
};

} // namespace

TEST_F(VST3ScanTest, AListingBecomesTheseRecordsAndIsAskedAgainWhereThereAreNone)
{
    const QByteArray longText(64, 'n');
    const struct {
        const char *name;
        QByteArray script;
        QByteArray records; ///< of the file, between blanks: name, vendor, sub-categories, whether it works
    } rows[] = {
        {"class vendor", "class cv\nvendor \"Class Maker\"\n", "cv|Class Maker|Fx|1"},
        {"no vendor at all", "factory-vendor \"\"\nclass nv\n", "nv||Fx|1"},
        {"old factory", "generation 1\nclass old\nvendor Unasked\n", "old|Fixture Works||1"},
        {"newer data refused", "class nir\nvendor V\nanswer class-info2 false\n", "nir|Fixture Works||1"},
        {"factory data refused", "class fir\nanswer factory-info false\n", "fir||Fx|1"},
        {"full fields",
         "class " + longText + "\nvendor " + longText + "\nsubcategories " + longText + longText,
         longText + '|' + longText + '|' + longText + longText + "|1"},
        {"invalid UTF-8", "class \"a\\xFF\\xC3(b\"\nvendor \"\\x80\"\n", "a\uFFFD\uFFFD(b|\uFFFD|Fx|1"},
        {"beyond 16 bits", "class \"🎛 リバーブ\"\n", "🎛 リバーブ|Fixture Works|Fx|1"},
        {"empty name", "class \"\"\n", "|Fixture Works|Fx|1"},
        {"signs", "class \" %s%n A & B\"\n", " %s%n A & B|Fixture Works|Fx|1"},
        {"an id twice", "class B1\n" + kIdA + "class B2\n" + kIdA, "B1|Fixture Works|Fx|1"},
        {"one of two fails", "class D1\nclass D2\nanswer initialize false D1\n", "D2|Fixture Works|Fx|1"},
        {"no class", "", "no class|||0"},
        {"does not start", "answer module-entry false\n", "does not start|||0"},
        {"null factory", "answer get-factory null\n", ""},
        {"WaveShell without a class", "", ""}};
    QStringList asked;
    for (const auto &row : rows) {
        add(row.name, row.script);
        if (row.records.isEmpty())
            asked.append(row.name);
    }
    scan();
    const QStringList all = records("Path Name Vendor Categories Working");
    for (const auto &row : rows) {
        QStringList found = all.filter('/' + QString(row.name) + ".vst3|");
        found.replaceInStrings(modulePath(row.name) + '|', QString());
        EXPECT_EQ(found.join(' '), row.records) << row.name;
    }
    scan();
    EXPECT_EQ(loaded(), asked);
    EXPECT_EQ(records("Path Name Vendor Categories Working"), all);
}

TEST_F(VST3ScanTest, MarksOutliveUpdatesFailuresAndMoves)
{
    const QByteArray moved = "class Moved\nid 0000000000000000000000000000000D\n";
    add("Comp", "class Liked\n" + kIdA + "class Gone\n");
    add("Failing");
    add("Off");
    const QString touched = add("Touched");
    add("old/Moved", moved);
    scan();
    for (const char *name : {"Liked", "Failing", "Moved"}) {
        mark(name, "Favourite", "1");
        mark(name, "CategoryMask", "16384");
    }
    mark("Off", "Enabled", "0");
    update("Comp", "class New\nsubcategories Fx|EQ\nclass Renamed\nsubcategories Fx|EQ\n" + kIdA);
    update("Failing", "answer module-entry false\n");
    update("Off", "class Changed\n");
    m_folder.setModified(touched, QDateTime({2021, 3, 4}, {5, 6, 59})); // the same minute
    ASSERT_TRUE(QFile::remove(modulePath("old/Moved")));
    add("new/Moved", moved);
    scan();
    EXPECT_EQ(loaded(), texts({"Comp", "Failing", "Moved"})) << "what is switched off is not asked";
    EXPECT_EQ(sortedRecords("Name FileTime CategoryMask Favourite Enabled Working"),
              texts({"Failing|2022-03-04 05:06|0|0|1|0", "Failing|2022-03-04 05:06|16384|1|1|0",
                     "Moved|2021-03-04 05:06|16384|1|1|1", "New|2022-03-04 05:06|16|0|1|1",
                     "Off|2021-03-04 05:06|0|0|0|1", "Renamed|2022-03-04 05:06|16384|1|1|1",
                     "Touched|2021-03-04 05:06|0|0|1|1"}));
    add("Failing");
    scan();
    EXPECT_TRUE(records("Name CategoryMask Favourite Working").contains("Failing|16384|1|1"));
    expectSettled();
}

TEST_F(VST3ScanTest, ACrashedWaveShellIsLeftAloneForOneRun)
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
    add("WaveShell1", "class W\n");
    scan();
    scan();
    update("WaveShell1", "");
    scan();
    EXPECT_EQ(sortedRecords("Name Enabled Working"), texts({"W|1|1", "a Healthy|1|1"}))
        << "an empty one keeps its records";
}

TEST_F(VST3ScanTest, Bundles)
{
    m_folder.write(addBundle("Several") + '/' + kForeignModule, "for another system");
    ASSERT_TRUE(QDir().rename(addBundle("Before"), modulePath("After"))); // its module has the old name
    ASSERT_TRUE(QDir().rename(addBundle("Loud"), m_folder.plugins() + "/Loud.VST3"));
    ASSERT_TRUE(QDir().mkpath(modulePath("Empty") + "/Contents"));
    const QString bundle = addBundle("Usual");
    scan();
    EXPECT_EQ(sortedRecords("Name Working"),
              texts({"Before|1", "Empty|0", "Loud|1", "Several|1", "Usual|1"}));
    m_folder.write(bundle + "/Contents/moduleinfo.json", "{}"); // the folder is newer now
    expectSettled();
    dateLater(vst3BundleBinary(bundle));
    scan();
    EXPECT_EQ(loaded(), texts({"Usual"}));
    EXPECT_TRUE(records("Path FileTime").contains(vst3BundlePath(bundle) + "|2022-03-04 05:06"));
}
