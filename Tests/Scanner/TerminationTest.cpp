#include "Tests/Scanner/InterruptedProbe.h"

#include <QElapsedTimer>

namespace {

class Termination : public InterruptedProbe, public testing::WithParamInterface<TerminationWay> {
protected:
    ScannerOutcome interrupt(const std::vector<TerminationWay> &ways) const
    {
        ScannerRun scanner(scannerProgram(), m_folder);
        return InterruptedProbe::interrupt(scanner, ways);
    }
};

} // namespace

TEST_P(Termination, ASlowPluginIsWaitedForAndKept)
{
    slowDown("delay initialize 500\n");
    EXPECT_TRUE(interrupt({GetParam()}).succeeded());
    EXPECT_EQ(renewed(), QStringList({"A", "B"}));
    EXPECT_EQ(m_folder.markers(), QStringList());

    forgetTrace();
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(loaded(), QStringList("C"));
    EXPECT_EQ(renewed(), kThree);
}

TEST_P(Termination, APluginThatHangsIsLeftAndNotBlamed)
{
    slowDown("fault initialize hang\n");
    QElapsedTimer clock;
    clock.start();
    EXPECT_TRUE(interrupt({GetParam(), GetParam()}).succeeded());
    EXPECT_GE(clock.elapsed(), 2000);
    EXPECT_LT(clock.elapsed(), 10000);
    EXPECT_EQ(m_folder.markers(), QStringList());
    EXPECT_EQ(renewed(), QStringList("A"));

    slowDown({});
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(loaded(), QStringList({"B", "C"}));
    EXPECT_EQ(renewed(), kThree);
}

INSTANTIATE_TEST_SUITE_P(By, Termination, testing::ValuesIn(terminationWays()),
                         [](const auto &row) { return std::string(row.param.name); });

TEST_F(InterruptedProbe, ARequestNeverLeavesAMarkerOrHalfACatalogue)
{
    slowDown("delay initialize 20\n");
    const QByteArray before = m_folder.catalogue();
    QElapsedTimer clock;
    clock.start();
    EXPECT_TRUE(run().succeeded());
    const qint64 whole = clock.elapsed();
    for (int moment = 0; moment < 20; ++moment) {
        SCOPED_TRACE(moment);
        m_folder.write(cataloguePath(), before);
        forgetTrace();
        ScannerRun scanner(scannerProgram(), m_folder);
        ASSERT_TRUE(scanner.start());
        clock.restart();
        scanner.waitUntil([&] { return clock.elapsed() >= whole * moment / 20; });
        scanner.requestTermination();
        const ScannerOutcome outcome = scanner.wait();
        // Before the scan begins nobody listens yet; then nothing has been touched.
        EXPECT_TRUE(outcome.succeeded() ||
                    (outcome.signal == terminationWays().front().number && loaded().isEmpty()));
        EXPECT_EQ(m_folder.markers(), QStringList());
        EXPECT_EQ(renewed().size(), loaded().size());
    }
}
