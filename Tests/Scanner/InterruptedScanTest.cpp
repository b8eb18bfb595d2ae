#include "Tests/Scanner/DisturbedScan.h"
#include "Tests/Scanner/InterruptedProbe.h"

#include <QElapsedTimer>

namespace {

class InterruptedRescan : public InterruptedProbe, public testing::WithParamInterface<int> {};

/// Kills the scanner at moments spread over the scan. The number is the first moment's.
class KillSweep : public DisturbedScan, public testing::WithParamInterface<int> {
protected:
    KillSweep()
        : DisturbedScan("delay initialize 4\n")
    {}
    void killAt(qint64 milliseconds) const
    {
        ScannerRun scanner(scannerProgram(), m_folder);
        ASSERT_TRUE(scanner.start());
        QElapsedTimer clock;
        clock.start();
        scanner.waitUntil([&] { return clock.elapsed() >= milliseconds; });
        scanner.kill();
        scanner.wait();
    }
};

} // namespace

TEST_P(InterruptedRescan, AKilledScannerCostsNoMarks)
{
    const QString &culprit = kThree[GetParam()];
    slowDown("fault initialize hang\n", culprit);
    ScannerRun scanner(scannerProgram(), m_folder);
    ASSERT_TRUE(scanner.start());
    ASSERT_TRUE(waitForStage(scanner, culprit, "initialize"));
    scanner.kill();
    scanner.wait();
    EXPECT_EQ(renewed(), kThree.mid(0, GetParam()));
    EXPECT_EQ(m_folder.markers(), QStringList(culprit + ".scan3"));

    EXPECT_EQ(runUntilSettled(scannerProgram(), m_folder).size(), 1u);
    EXPECT_EQ(renewed(culprit), kThree);
}

INSTANTIATE_TEST_SUITE_P(At, InterruptedRescan, testing::Values(0, 1, 2),
                         [](const auto &row) { return kThree[row.param].toStdString(); });

TEST_P(KillSweep, EveryMomentLeavesAWholeCatalogue)
{
    const QByteArray before = m_folder.catalogue();
    QElapsedTimer clock;
    clock.start();
    EXPECT_TRUE(run().succeeded());
    const qint64 whole = clock.elapsed();
    for (int moment = GetParam(); moment < 40; moment += 4) {
        m_folder.write(cataloguePath(), before);
        killAt(whole * moment / 40);
        SCOPED_TRACE(moment);
        EXPECT_EQ(listed(), m_names);
        const std::set<QString> named = namedByMarkers();
        EXPECT_LE(named.size(), 1u);
        expectSettled(named);
    }
}

INSTANTIATE_TEST_SUITE_P(From, KillSweep, testing::Range(0, 4));
