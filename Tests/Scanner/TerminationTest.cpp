#include "Tests/Scanner/ScannerTest.h"

#include <QElapsedTimer>

#include <csignal>

namespace {

const QStringList kThree{QStringLiteral("A"), QStringLiteral("B"), QStringLiteral("C")};

/// Three listed favourites that changed since; a request comes while the second one is being probed.
class InterruptedProbe : public ScannerTest {
protected:
    InterruptedProbe()
    {
        addListedModules(kThree);
        editCatalogue("<Favourite>0<", "<Favourite>1<");
    }
    void slowDown(const QByteArray &script) const
    {
        addModule(QStringLiteral("B"), script);
        touchModules(kThree);
    }
    /// Sends the signals, one after the other, once the second module is being probed.
    ScannerOutcome interrupt(ScannerRun &scanner, const std::vector<int> &signalNumbers) const
    {
        if (!scanner.start() || !waitForStage(scanner, QStringLiteral("B"), QStringLiteral("initialize")))
            return {};
        for (const int number : signalNumbers)
            ::kill(static_cast<pid_t>(scanner.processId()), number);
        return scanner.wait();
    }
    ScannerOutcome interrupt(const std::vector<int> &signalNumbers) const
    {
        ScannerRun scanner(scannerProgram(), m_folder);
        return interrupt(scanner, signalNumbers);
    }
    /// The modules whose records hold their new time stamp; all three must be there with their marks.
    QStringList renewed() const
    {
        QStringList names;
        EXPECT_EQ(listed(), kThree);
        for (const auto &[name, record] : records()) {
            EXPECT_TRUE(record.favourite && record.enabled && record.working) << qPrintable(name);
            if (record.fileTime == QStringLiteral("2021-05-06 07:08"))
                names.append(name);
        }
        return names;
    }
};

class Termination : public InterruptedProbe, public testing::WithParamInterface<int> {};

} // namespace

TEST_P(Termination, ASlowPluginIsWaitedForAndKept)
{
    slowDown("delay initialize 500\n");
    EXPECT_TRUE(interrupt({GetParam()}).succeeded());
    EXPECT_EQ(renewed(), QStringList({QStringLiteral("A"), QStringLiteral("B")}));
    EXPECT_EQ(m_folder.markers(), QStringList());

    forgetTrace();
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(loaded(), QStringList(QStringLiteral("C")));
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
    EXPECT_EQ(renewed(), QStringList(QStringLiteral("A")));

    slowDown({});
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(loaded(), QStringList({QStringLiteral("B"), QStringLiteral("C")}));
    EXPECT_EQ(renewed(), kThree);
}

INSTANTIATE_TEST_SUITE_P(By, Termination, testing::Values(SIGTERM, SIGINT, SIGHUP), [](const auto &row) {
    return std::string(row.param == SIGTERM ? "SIGTERM" : row.param == SIGINT ? "SIGINT" : "SIGHUP");
});

TEST_F(InterruptedProbe, ASignalThatTheStarterIgnoresIsIgnored)
{
    slowDown("delay initialize 300\n");
    ScannerRun scanner(QStringLiteral("/bin/sh"), m_folder);
    scanner.setArguments({QStringLiteral("-c"), QStringLiteral("trap '' HUP INT; exec \"$0\" \"$1\""),
                          scannerProgram(), m_folder.scanList()});
    EXPECT_TRUE(interrupt(scanner, {SIGHUP, SIGINT}).succeeded());
    EXPECT_EQ(renewed(), kThree);
}

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
        EXPECT_TRUE(outcome.succeeded() || (outcome.signal == SIGTERM && loaded().isEmpty()));
        EXPECT_EQ(m_folder.markers(), QStringList());
        EXPECT_EQ(renewed().size(), loaded().size());
    }
}

TEST_F(InterruptedProbe, AReaderThatGoesAwayDoesNotEndTheScan)
{
    slowDown("effect initialize print 200\n");
    ScannerRun scanner(QStringLiteral("/bin/sh"), m_folder);
    scanner.setArguments({QStringLiteral("-c"),
                          QStringLiteral("{ \"$0\" \"$1\" 2>&1; echo $? > \"$2\"; } | head -c 1"),
                          scannerProgram(), m_folder.scanList(), m_folder.path(QStringLiteral("status"))});
    scanner.removeEnvironment(QStringLiteral("FXPROBE_LOG"));
    EXPECT_TRUE(scanner.run().succeeded());
    EXPECT_EQ(m_folder.read(QStringLiteral("status")), "0\n");
    EXPECT_EQ(renewed(), kThree);
}
