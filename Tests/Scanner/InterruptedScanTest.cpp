#include "Tests/Scanner/DisturbedScan.h"

#include <QElapsedTimer>

namespace {

const QStringList kThree{QStringLiteral("A"), QStringLiteral("B"), QStringLiteral("C")};

/// Three listed modules with the user's marks, all changed since.
class InterruptedRescan : public ScannerTest, public testing::WithParamInterface<int> {
protected:
    InterruptedRescan()
    {
        addListedModules(kThree);
        editCatalogue("<Favourite>0<", "<Favourite>1<");
        editCatalogue("<CategoryMask>0<", "<CategoryMask>16<");
        touchModules(kThree);
    }
    void expectMarks() const
    {
        for (const auto &[name, record] : records()) {
            EXPECT_TRUE(record.favourite) << qPrintable(name);
            EXPECT_NE(record.category, 0u) << qPrintable(name);
        }
        EXPECT_EQ(listed(), kThree);
    }
};

/// Kills the scanner at moments spread over the scan. The number is the first moment's.
class KillSweep : public DisturbedScan, public testing::WithParamInterface<int> {
protected:
    KillSweep()
        : DisturbedScan("delay initialize 4\n")
    {}
    void killAt(qint64 milliseconds) const;
};

void KillSweep::killAt(qint64 milliseconds) const
{
    ScannerRun scanner(scannerProgram(), m_folder);
    ASSERT_TRUE(scanner.start());
    QElapsedTimer clock;
    clock.start();
    scanner.waitUntil([&] { return clock.elapsed() >= milliseconds; });
    scanner.kill();
    scanner.wait();
}

} // namespace

TEST_P(InterruptedRescan, AKilledScannerCostsNoMarks)
{
    const QString &culprit = kThree[GetParam()];
    addModule(culprit, "fault initialize hang\n");
    touchModules(kThree);
    ScannerRun scanner(scannerProgram(), m_folder);
    ASSERT_TRUE(scanner.start());
    ASSERT_TRUE(waitForStage(scanner, culprit, QStringLiteral("initialize")));
    scanner.kill();
    scanner.wait();

    expectMarks();
    auto interim = records();
    for (int i = 0; i < kThree.size(); ++i)
        EXPECT_EQ(interim[kThree[i]].fileTime,
                  i < GetParam() ? QStringLiteral("2021-05-06 07:08") : QStringLiteral("2020-01-02 03:04"));
    EXPECT_EQ(m_folder.markers(), QStringList(culprit + QStringLiteral(".scan3")));

    EXPECT_EQ(runUntilSettled(scannerProgram(), m_folder).size(), 1u);
    expectMarks();
    for (const auto &[name, record] : records()) {
        EXPECT_EQ(record.fileTime, QStringLiteral("2021-05-06 07:08"));
        EXPECT_EQ(record.working, name != culprit);
        EXPECT_EQ(record.enabled, name != culprit);
    }
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
