#include "Tests/Scanner/InterruptedScan.h"

#include "Tests/Support/VST3Fixture.h"

#include <QElapsedTimer>
#include <QFile>

namespace {

class Termination : public InterruptedScan, public testing::WithParamInterface<TerminationWay> {
protected:
    ScannerRun m_scanner{scannerProgram(), m_folder};
};

/// A scanner that hangs in the middle of its second module.
class SecondScanner : public InterruptedScan {
protected:
    SecondScanner()
    {
        update("fault initialize hang\n");
        EXPECT_TRUE(m_first.start() && waitForStage(m_first, "B", "initialize"));
    }

    ScannerRun m_first{scannerProgram(), m_folder};
};

} // namespace

TEST_P(Termination, ASlowPluginIsWaitedForAndKept)
{
    update("delay initialize 500\n");
    EXPECT_TRUE(interrupt(m_scanner, {GetParam()}).succeeded());
    EXPECT_EQ(renewed(), QStringList({"A", "B"}));
    EXPECT_EQ(m_folder.markers(), QStringList());
    scan();
    EXPECT_EQ(loaded(), QStringList("C"));
    EXPECT_EQ(renewed(), m_names);
}

TEST_P(Termination, APluginThatHangsIsLeftAndNotBlamed)
{
    update("fault initialize hang\n");
    QElapsedTimer clock;
    clock.start();
    EXPECT_TRUE(interrupt(m_scanner, {GetParam(), GetParam()}).succeeded());
    EXPECT_GE(clock.elapsed(), 2000);
    EXPECT_LT(clock.elapsed(), 10000);
    EXPECT_EQ(m_folder.markers(), QStringList());
    EXPECT_EQ(renewed(), QStringList("A"));
    update({});
    scan();
    EXPECT_EQ(loaded(), QStringList({"B", "C"}));
}

INSTANTIATE_TEST_SUITE_P(By, Termination, testing::ValuesIn(terminationWays()),
                         [](const auto &row) { return std::string(row.param.name); });

TEST_F(SecondScanner, LeavesABusyFolderAlone)
{
    const QString link = m_folder.path("Link");
    QFile::link(m_folder.dataFolder(), link);
    const auto before = effectsFolder();
    const QStringList traceBefore = trace();
    // Those that do not exist here name no folder, and nothing happens at all.
    for (const QString &scanList :
         {m_folder.scanList(), m_folder.path("Effects/../Effects/FXScan.xml"), link + "/Effects/FXScan.xml",
          m_folder.dataFolder().toUpper() + "/Effects/FXScan.xml"}) {
        SCOPED_TRACE(qPrintable(scanList));
        ScannerRun second(scannerProgram(), m_folder);
        second.setArguments({scanList});
        const ScannerOutcome outcome = second.run();
        EXPECT_TRUE(outcome.succeeded());
        const QString folder = scanList.left(scanList.lastIndexOf("/Effects/"));
        EXPECT_EQ(outcome.log.contains("Another scanner is at work for " + folder), QFile::exists(scanList))
            << qPrintable(outcome.log);
        EXPECT_EQ(effectsFolder(), before);
        EXPECT_EQ(trace(), traceBefore);
    }
}

TEST_F(SecondScanner, WorksOnAnotherFolder)
{
    const TestFolder other;
    addVST3File(other.plugins(), "Comp");
    other.writeScanList();
    EXPECT_TRUE(ScannerRun(scannerProgram(), other).run().succeeded());
    EXPECT_TRUE(other.catalogue().contains("<Name>Comp</Name>")) << other.catalogue().constData();
}
