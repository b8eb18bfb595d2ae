#include "Tests/Support/PlatformValues.h"
#include "Tests/Support/ScanBench.h"
#include "Tests/Support/VST3Fixture.h"

#include <QDir>
#include <QFile>

namespace {

const QByteArray kIdA = "id 0000000000000000000000000000000A\n";

class VST3ScanTest : public ScanBench {
protected:
    QString addBundle(const QString &name) const
    {
        const QString bundle =
            addVST3Bundle(m_folder.plugins(), name, traceStatement(name) + "class " + name.toUtf8());
        dateFirst(vst3BundleBinary(bundle));
        return bundle;
    }
};

} // namespace

TEST_F(VST3ScanTest, MarksOutliveUpdatesFailuresAndMoves)
{
    const QByteArray moved = "class Moved\nid 0000000000000000000000000000000D\n";
    put("Comp.vst3", "class Liked\n" + kIdA + "class Gone\n");
    put("Failing.vst3");
    put("Off.vst3");
    const QString touched = put("Touched.vst3");
    put("old/Moved.vst3", moved);
    scan();
    for (const char *name : {"Liked", "Failing", "Moved"}) {
        mark(name, "Favourite", "1");
        mark(name, "CategoryMask", "16384");
    }
    mark("Off", "Enabled", "0");
    dateLater(
        put("Comp.vst3", "class New\nsubcategories Fx|EQ\nclass Renamed\nsubcategories Fx|EQ\n" + kIdA));
    dateLater(put("Failing.vst3", "answer module-entry false\n"));
    dateLater(put("Off.vst3", "class Changed\n"));
    m_folder.setModified(touched, QDateTime({2021, 3, 4}, {5, 6, 59})); // the same minute
    ASSERT_TRUE(QFile::remove(modulePath("old/Moved")));
    put("new/Moved.vst3", moved);
    scan();
    EXPECT_EQ(loaded(), texts({"Comp", "Failing", "Moved"})) << "what is switched off is not asked";
    EXPECT_EQ(sortedRecords("Name FileTime CategoryMask Favourite Enabled Working"),
              texts({"Failing|2022-03-04 05:06|0|0|1|0", "Failing|2022-03-04 05:06|16384|1|1|0",
                     "Moved|2021-03-04 05:06|16384|1|1|1", "New|2022-03-04 05:06|16|0|1|1",
                     "Off|2021-03-04 05:06|0|0|0|1", "Renamed|2022-03-04 05:06|16384|1|1|1",
                     "Touched|2021-03-04 05:06|0|0|1|1"}));
    put("Failing.vst3");
    scan();
    EXPECT_TRUE(records("Name CategoryMask Favourite Working").contains("Failing|16384|1|1"));
    expectSettled();
}

TEST_F(VST3ScanTest, ACrashedWaveShellIsLeftAloneForOneRun)
{
    put("WaveShell1.vst3", "class W\nfault initialize kill\n");
    put("a Healthy.vst3");
    scanOnce();
    EXPECT_EQ(m_folder.markers(), texts({"WaveShell1.scan3"}));
    scan();
    EXPECT_EQ(loaded(), QStringList());
    EXPECT_EQ(records("Name"), texts({"a Healthy"}));
    scanOnce();
    EXPECT_EQ(loaded(), texts({"WaveShell1"}));
    put("WaveShell1.vst3", "class W\n");
    scan();
    scan();
    dateLater(put("WaveShell1.vst3", "class W\ncategory None\n"));
    scan();
    scan();
    EXPECT_EQ(loaded(), texts({"WaveShell1"})) << "is asked again";
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
