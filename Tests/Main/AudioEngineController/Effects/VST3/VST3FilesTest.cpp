#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"
#include "Tests/Support/PlatformValues.h"

#include <QDir>
#include <QFile>

namespace {

class VST3Files : public VST3ScanBench {
protected:
    QString addBundle(const QString &name) const
    {
        const QByteArray traced =
            "trace \"" + m_folder.path(QStringLiteral("trace")).toUtf8() + "\" \"" + name.toUtf8() + "\"\n";
        const QString bundle =
            addVST3Bundle(m_folder.plugins(), name, traced + "class \"" + name.toUtf8() + "\"\n");
        m_folder.setModified(vst3BundleBinary(bundle), QDateTime({2021, 3, 4}, {5, 6}));
        return bundle;
    }
    QString inPlugins(const char *name) const
    {
        return m_folder.plugins() + QLatin1Char('/') + QLatin1String(name);
    }
    QStringList names() const { return sortedRecords("Name"); }
};

} // namespace

TEST_F(VST3Files, TheBinaryInsideABundleIsWhatCounts)
{
    const QString bundle = addBundle(QStringLiteral("Bundle"));
    scan();
    EXPECT_EQ(records("Name Path FileTime"), QStringList{QStringLiteral("Bundle|") + vst3BundlePath(bundle) +
                                                         QStringLiteral("|2021-03-04 05:06")});
    m_folder.write(bundle + QStringLiteral("/Contents/moduleinfo.json"), "{}"); // the folder is newer now
    m_folder.write(bundle + QStringLiteral("/Contents/") + kBundleFolder + QStringLiteral("/data"), "x");
    scan();
    EXPECT_EQ(loaded(), QStringList());
    m_folder.setModified(vst3BundleBinary(bundle), QDateTime({2022, 3, 4}, {5, 6}));
    scan();
    EXPECT_EQ(loaded(), texts({"Bundle"}));
    EXPECT_EQ(records("FileTime"), texts({"2022-03-04 05:06"}));
}

TEST_F(VST3Files, BundlesInTheWild)
{
    // A bundle for several systems: the other system's module is no plug-in of this one.
    const QString several = addBundle(QStringLiteral("Several"));
    m_folder.write(several + QLatin1Char('/') + kForeignModule, "not for us");
    // A bundle that was renamed by its user holds a module of the old name.
    const QString renamed = addBundle(QStringLiteral("Before"));
    ASSERT_TRUE(QDir().rename(renamed, modulePath(QStringLiteral("After"))));
    // Capitals, as they come from other systems.
    ASSERT_TRUE(QDir().rename(addBundle(QStringLiteral("Loud")), inPlugins("Loud.VST3")));
    ASSERT_TRUE(QFile::rename(add(QStringLiteral("Plain")), inPlugins("Plain.VST3")));
    QFile::rename(modulePath(QStringLiteral("Plain")) + QStringLiteral(".script"),
                  inPlugins("Plain.VST3.script"));
    scan();
    EXPECT_EQ(names(), texts({"Before", "Loud", "Plain", "Several"}));
    EXPECT_EQ(records("Working").count(QStringLiteral("1")), 4);
    scan();
    EXPECT_EQ(loaded(), QStringList());
}

TEST_F(VST3Files, OneModuleInTwoPlaces)
{
    const QByteArray script = "class Comp\nid 0000000000000000000000000000000A\n";
    const QString first = add(QStringLiteral("a/Comp"), script);
    add(QStringLiteral("b/Comp"), script);
    scan();
    const QStringList expected{QStringLiteral("Comp|") + first};
    EXPECT_EQ(records("Name Path"), expected);
    // The copy has nothing of its own to say, and is not loaded each time to find that out.
    scan();
    EXPECT_EQ(loaded(), QStringList());
    EXPECT_EQ(records("Name Path"), expected);
}
