#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QFile>

#include <sys/stat.h>

namespace {

using VST3FileSystem = VST3ScanBench;

} // namespace

TEST_F(VST3FileSystem, LinkedModulesAndFoldersAreFollowedWhereTheyAreListed)
{
    const QString elsewhere = m_folder.path("Elsewhere"), root = m_folder.path("Root");
    m_folder.write(modulePath("File") + ".script",
                   traceStatement("File") + "class File\n"); // beside the link
    const QString file = addVST3File(elsewhere, "File");
    ASSERT_TRUE(QFile::link(file, modulePath("File")));
    ASSERT_TRUE(QFile::link(addVST3Bundle(elsewhere, "Bundle", traceStatement("Bundle") + "class Bundle\n"),
                            modulePath("Bundle")));
    ASSERT_TRUE(QFile::link(modulePath("gone"), modulePath("Dangling")));
    addVST3File(root, "Rooted", traceStatement("Rooted") + "class Rooted\n");
    ASSERT_TRUE(QFile::link(root, m_folder.path("Linked root")));
    m_folder.writeScanList({m_folder.plugins(), m_folder.path("Linked root")});
    scan();
    EXPECT_EQ(loaded(), texts({"Bundle", "File", "Rooted"}));
    EXPECT_EQ(sortedRecords("Name"), texts({"Bundle", "File", "Rooted"}));
    expectSettled();
    dateLater(file); // the time of a linked module is that of what it points to
    scan();
    EXPECT_EQ(loaded(), texts({"File"}));
}

TEST_F(VST3FileSystem, APipeInABundleIsNotWaitedFor)
{
    m_folder.write("Plugins/Pipe.vst3/Contents/x86_64-linux/other", "");
    const QString pipe = m_folder.path("Plugins/Pipe.vst3/Contents/x86_64-linux/Pipe.so");
    ASSERT_EQ(mkfifo(QFile::encodeName(pipe).constData(), 0644), 0);
    const ScannerOutcome outcome = scanOnce();
    EXPECT_TRUE(outcome.succeeded());
    EXPECT_TRUE(outcome.log.contains("it is not a regular file")) << qPrintable(outcome.log);
    EXPECT_EQ(records("Name Enabled Working"), texts({"Pipe|1|0"}));
}
