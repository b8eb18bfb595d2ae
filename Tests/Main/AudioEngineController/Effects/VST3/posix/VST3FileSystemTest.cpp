#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QFile>

namespace {

class VST3FileSystem : public VST3ScanBench {
protected:
    QString inPlugins(const char *name) const
    {
        return m_folder.plugins() + QLatin1Char('/') + QLatin1String(name);
    }
};

} // namespace

TEST_F(VST3FileSystem, LinkedModulesAndFoldersAreFollowedWhereTheyAreListed)
{
    const QString elsewhere = m_folder.path(QStringLiteral("Elsewhere"));
    const QByteArray traced = "trace \"" + m_folder.path(QStringLiteral("trace")).toUtf8() + "\" ";
    m_folder.write(inPlugins("File.vst3.script"), traced + "File\nclass File\n"); // beside the link
    const QString file = addVST3File(elsewhere, QStringLiteral("File"));
    const QString bundle =
        addVST3Bundle(elsewhere, QStringLiteral("Bundle"), traced + "Bundle\nclass Bundle\n");
    ASSERT_TRUE(QFile::link(file, inPlugins("File.vst3")));
    ASSERT_TRUE(QFile::link(bundle, inPlugins("Bundle.vst3")));
    ASSERT_TRUE(QFile::link(inPlugins("gone.vst3"), inPlugins("Dangling.vst3")));
    addVST3File(m_folder.path(QStringLiteral("Root")), QStringLiteral("Rooted"),
                traced + "Rooted\nclass Rooted\n");
    ASSERT_TRUE(
        QFile::link(m_folder.path(QStringLiteral("Root")), m_folder.path(QStringLiteral("Linked root"))));
    m_folder.writeScanList({m_folder.plugins(), m_folder.path(QStringLiteral("Linked root"))});
    scan();
    EXPECT_EQ(loaded(), texts({"Bundle", "File", "Rooted"}));
    EXPECT_EQ(sortedRecords("Name"), texts({"Bundle", "File", "Rooted"}));
    scan();
    EXPECT_EQ(loaded(), QStringList());
    // The time of a linked module is that of what it points to.
    m_folder.setModified(file, QDateTime({2022, 3, 4}, {5, 6}));
    scan();
    EXPECT_EQ(loaded(), texts({"File"}));
}
