#include "Tests/Scanner/ScannerTest.h"

#include <QFile>

namespace {

class SecondScanner : public ScannerTest {
protected:
    SecondScanner()
    {
        addModule("Slow", "class Slow\nfault initialize hang\n");
        addModule("After");
        m_folder.write("Effects/Earlier.scan", "<CrashedPlugin>");
    }
    /// Starts a scanner that stops in the middle of its second module.
    bool startFirst() { return m_first.start() && waitForStage(m_first, "Slow", "initialize"); }

    ScannerRun m_first{scannerProgram(), m_folder};
};

} // namespace

TEST_F(SecondScanner, LeavesABusyFolderAlone)
{
    const QString link = m_folder.path("Link");
    const bool linked = QFile::link(m_folder.dataFolder(), link);
    ASSERT_TRUE(startFirst());
    const auto before = effectsFolder();
    const QStringList traceBefore = trace();
    const QString otherCase = m_folder.dataFolder().toUpper();
    for (const QString &scanList : {m_folder.scanList(), m_folder.path("Effects/../Effects/FXScan.xml"),
                                    link + "/Effects/FXScan.xml", otherCase + "/Effects/FXScan.xml"}) {
        SCOPED_TRACE(qPrintable(scanList));
        if ((!linked && scanList.startsWith(link)) ||
            (kPathCase == Qt::CaseSensitive && scanList.startsWith(otherCase)))
            continue;
        ScannerRun second(scannerProgram(), m_folder);
        second.setArguments({scanList});
        const ScannerOutcome outcome = second.run();
        EXPECT_TRUE(outcome.succeeded());
        EXPECT_TRUE(outcome.log.contains("Another scanner is at work")) << qPrintable(outcome.log);
        EXPECT_EQ(effectsFolder(), before);
        EXPECT_EQ(trace(), traceBefore);
    }
}

TEST_F(SecondScanner, AnotherFolderIsAnotherMatter)
{
    ASSERT_TRUE(startFirst());
    const TestFolder other;
    addVST3File(other.plugins(), "Comp");
    other.writeScanList();
    EXPECT_TRUE(ScannerRun(scannerProgram(), other).run().succeeded());
    EXPECT_TRUE(other.catalogue().contains("<Name>Comp</Name>")) << other.catalogue().constData();
    EXPECT_TRUE(m_folder.markers().contains("Slow.scan3"));
}
