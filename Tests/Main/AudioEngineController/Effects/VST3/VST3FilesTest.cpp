#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"
#include "Tests/Support/PlatformValues.h"

#include <QDir>
#include <QFile>

namespace {

class VST3Files : public VST3ScanBench {
protected:
    QString addBundle(const QString &name) const
    {
        const QString bundle = addVST3Bundle(m_folder.plugins(), name,
                                             traceStatement(name) + "class \"" + name.toUtf8() + "\"\n");
        dateFirst(vst3BundleBinary(bundle));
        return bundle;
    }
    QString inPlugins(const char *name) const { return m_folder.plugins() + '/' + name; }
};

} // namespace

TEST_F(VST3Files, TheBinaryInsideABundleIsWhatCounts)
{
    const QString bundle = addBundle("Bundle");
    scan();
    EXPECT_EQ(records("Name Path FileTime"),
              QStringList{"Bundle|" + vst3BundlePath(bundle) + "|2021-03-04 05:06"});
    m_folder.write(bundle + "/Contents/moduleinfo.json", "{}"); // the folder is newer now
    m_folder.write(bundle + "/Contents/" + kBundleFolder + "/data", "x");
    scan();
    EXPECT_EQ(loaded(), QStringList());
    m_folder.setModified(vst3BundleBinary(bundle), QDateTime({2022, 3, 4}, {5, 6}));
    scan();
    EXPECT_EQ(loaded(), texts({"Bundle"}));
    EXPECT_EQ(records("FileTime"), texts({"2022-03-04 05:06"}));
}

TEST_F(VST3Files, BundlesInTheWild)
{
    // For several systems: the other system's module is no plug-in of this one.
    m_folder.write(addBundle("Several") + '/' + kForeignModule, "not for us");
    // Renamed by its user, it holds a module of the old name.
    ASSERT_TRUE(QDir().rename(addBundle("Before"), modulePath("After")));
    // Capitals, as they come from other systems.
    ASSERT_TRUE(QDir().rename(addBundle("Loud"), inPlugins("Loud.VST3")));
    ASSERT_TRUE(QFile::rename(add("Plain"), inPlugins("Plain.VST3")));
    QFile::rename(modulePath("Plain") + ".script", inPlugins("Plain.VST3.script"));
    scan();
    EXPECT_EQ(sortedRecords("Name Working"), texts({"Before|1", "Loud|1", "Plain|1", "Several|1"}));
    expectSettled();
}

TEST_F(VST3Files, OneModuleInTwoPlaces)
{
    const QByteArray script = "class Comp\nid 0000000000000000000000000000000A\n";
    const QString first = add("a/Comp", script);
    add("b/Comp", script);
    scan();
    const QStringList expected{"Comp|" + first};
    EXPECT_EQ(records("Name Path"), expected);
    expectSettled(); // the copy has nothing of its own to say, and is not loaded each time to find that out
}
