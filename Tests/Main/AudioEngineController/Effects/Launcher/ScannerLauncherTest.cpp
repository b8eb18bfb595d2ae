#include "Main/AudioEngineController/Effects/Launcher/ScannerLauncher.h"

#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/TestApplication.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST2Fixture.h"
#include "Tests/Support/VST3Fixture.h"

#include <QElapsedTimer>
#include <QFile>

#include <gtest/gtest.h>

#include <functional>
#include <thread>

namespace {

using How = ScannerRunEnd::How;

class Launcher : public testing::Test {
protected:
    ScannerLauncher::Job job(int limit = 0)
    {
        return {QStringLiteral(FXPROBE_STAND_IN), m_folder.scanList(), m_folder.effects(), limit,
                [this] { ++m_listsWritten; }};
    }
    void script(const char *lines) const { m_folder.write("stand-in", lines); }
    int runs() const { return m_folder.read("runs").count('\n'); }
    static void waitFor(const std::function<bool()> &condition)
    {
        while (!condition())
            std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
    /// Cancels a launch as soon as its first run is there.
    std::thread cancelWhenRunning()
    {
        return std::thread([this] {
            waitFor([this] { return runs() > 0 || !m_launcher.ends().empty(); });
            m_launcher.cancel();
        });
    }

    TestFolder m_folder;
    ScannerLauncher m_launcher;
    int m_listsWritten = 0;
};

} // namespace

TEST_F(Launcher, RunsAgainWhileMarkersSurviveAndTellsTheEndsApart)
{
    const struct {
        const char *name;
        const char *script;
        int runs;
        How lastEnd;
        int lastCode;
        const char *culprit; ///< of the first run
        const char *line;
    } rows[] = {
        {"no marker: one run", "exit=0", 1, How::Exited, 0, "", ""},
        {"a failing exit code alone is no reason to run again", "exit=3", 1, How::Exited, 3, "",
         "it ended by itself with exit code 3"},
        {"a crash without a marker neither", "fault", 1, How::Crashed, -1, "", ""},
        {"a marker: again", "marker=A.scan fault\nclear", 2, How::Exited, 0, "/p/A.scan", ""},
        {"a VST 3 marker too", "marker=A.scan3 exit=0\nclear", 2, How::Exited, 0, "/p/A.scan3", ""},
        {"no answer in time", "marker=A.scan hang\nclear", 2, How::Exited, 0, "/p/A.scan",
         "it was ended after 1 s without an answer"},
        {"a new marker in every run: ten runs", "clear marker=A.scan fault", 10, How::Crashed, -1,
         "/p/A.scan", ""},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        QFile::remove(m_folder.path("runs"));
        script(row.script);
        m_launcher.reset();
        m_listsWritten = 0;
        const CapturedLog log;
        m_launcher.run(job(QByteArray(row.script).contains("hang") ? 1 : 0));
        EXPECT_EQ(runs(), row.runs);
        EXPECT_EQ(m_listsWritten, row.runs);
        const std::vector<ScannerRunEnd> ends = m_launcher.ends();
        ASSERT_EQ(static_cast<int>(ends.size()), row.runs);
        EXPECT_EQ(ends.back().how, row.lastEnd);
        EXPECT_EQ(ends.back().how == How::Exited ? ends.back().code : -1, row.lastCode);
        QString culprits;
        for (const auto &culprit : ends.front().culprits)
            culprits += culprit.plugin.path;
        EXPECT_EQ(culprits, row.culprit);
        EXPECT_TRUE(log.contains(QLatin1String("The scanner has ended: ") + row.line));
    }
}

TEST_F(Launcher, AScannerThatHangsWhenAllIsDoneIsEndedAndNobodyIsBlamed)
{
    script("report hang");
    qputenv("FXPROBE_REPORT", m_folder.path("report").toUtf8());
    m_launcher.run(job(1));
    qunsetenv("FXPROBE_REPORT");
    ASSERT_EQ(m_launcher.ends().size(), 1u);
    EXPECT_EQ(m_launcher.ends()[0].how, How::TimeLimit);
    EXPECT_TRUE(m_launcher.ends()[0].culprits.empty());
}

TEST_F(Launcher, CancellingBlamesNobodyAndRunsNothingElse)
{
    // The marker of an earlier crash, which the run has not absorbed, is none of ours to delete.
    m_folder.write("Effects/Earlier.scan3", "<CrashedPlugin>");
    script("marker=A.scan hang");
    std::thread canceller = cancelWhenRunning();
    m_launcher.run(job());
    canceller.join();
    EXPECT_EQ(runs(), 1);
    EXPECT_EQ(m_folder.markers(), QStringList("Earlier.scan3"));
    ASSERT_EQ(m_launcher.ends().size(), 1u);
    EXPECT_EQ(m_launcher.ends()[0].how, How::Cancelled);
}

TEST_F(Launcher, AScannerThatCannotStartIsWaitedForUntilTheCancel)
{
    const CapturedLog log;
    ScannerLauncher::Job missing = job();
    missing.program = m_folder.path("no-such-program");
    std::thread canceller = cancelWhenRunning();
    m_launcher.run(missing);
    canceller.join();
    EXPECT_TRUE(log.contains("Scanner failed to Start: 0")); // QProcess::FailedToStart
    ASSERT_EQ(m_launcher.ends().size(), 1u);
    EXPECT_EQ(m_launcher.ends()[0].how, How::NotStarted);
    EXPECT_FALSE(m_launcher.ends()[0].text.isEmpty());
}

TEST_F(Launcher, TheRegistryScansOutOfProcessAndReloadsWhatChanged)
{
    const TestApplication workstation({m_folder.plugins()});
    addVST3File(m_folder.plugins(), "Comp");
    addVST2File(m_folder.plugins(), "Echo"); // a catalogue of nothing is written every time
    auto registry = std::make_unique<PluginHost>();
    registry->initialise(m_folder.dataFolder(), QString(), 48000, 1024);
    registry->Scan(true, false);
    EXPECT_TRUE(registry->completionEvent()->isSet());
    EXPECT_FALSE(registry->Scan(true, false)) << "one launcher at a time";
    EXPECT_EQ(workstation.changes, 1) << "the lists as they were";
    waitFor([&] { return !registry->isLauncherRunning(); });
    ASSERT_EQ(registry->host(PluginFormat::Vst3).effects().size(), 1u);
    EXPECT_EQ(registry->host(PluginFormat::Vst3).effects()[0].name, "Comp");
    EXPECT_EQ(workstation.changes, 2);
    registry->Scan(true, false);
    waitFor([&] { return !registry->isLauncherRunning(); });
    EXPECT_EQ(workstation.changes, 3) << "nothing changed, nothing reloaded";
    EXPECT_EQ(registry->host(PluginFormat::Vst3).effects().size(), 1u);

    addVST3File(m_folder.plugins(), "Hang", "class Hang\nfault initialize hang\n");
    registry->Scan(true, false);
    waitFor([&] { return !m_folder.markers().isEmpty(); });
    registry->host(PluginFormat::Vst3).ReadCatalogue();
    EXPECT_FALSE(m_folder.markers().isEmpty()) << "that of a scanner at work says nothing";
    QElapsedTimer time;
    time.start();
    registry.reset();
    EXPECT_LT(time.elapsed(), 20000) << "it ends its launcher";
    EXPECT_TRUE(m_folder.markers().isEmpty()) << "a cancel blames nobody";
}

TEST_F(Launcher, APluginThatAUserSkipsIsNotBlamedAndAskedAgain)
{
    for (const int jobs : {-1, 1, 3}) {
        SCOPED_TRACE(jobs);
        const TestFolder folder;
        const TestApplication workstation({folder.plugins()});
        addVST3File(folder.plugins(), "Before");
        addVST3File(folder.plugins(), "Later");
        const QString hanging = addVST3File(folder.plugins(), "Hang", "class Hang\nfault initialize hang\n");
        const QString known = addVST3File(folder.plugins(), "Known");
        PluginHost registry;
        registry.initialise(folder.dataFolder(), QString(), 48000, 1024);
        registry.setScanJobs(jobs);
        registry.Scan(true, false);
        waitFor([&] { return folder.markers().contains("Hang.scan3"); });
        registry.skipProbe(hanging);
        waitFor([&] { return !registry.isLauncherRunning(); });
        EXPECT_EQ(folder.markers(), QStringList());
        QStringList names;
        for (const EffectRecord &record : registry.host(PluginFormat::Vst3).effects())
            names.append(record.name);
        EXPECT_EQ(names.join(' '), "Before Known Later");
        EXPECT_EQ(registry.scannerEnds().size(), jobs < 0 ? 2u : 1u);

        // What is known of a file that is skipped stays, with its old time: it is asked again.
        QFile::remove(hanging);
        QFile::remove(hanging + ".script");
        folder.write("Plugins/Known.vst3.script", "class Known\nfault initialize hang\n");
        folder.setModified(known, QDateTime({2022, 3, 4}, {5, 6, 7}));
        registry.Scan(true, false);
        waitFor([&] { return folder.markers().contains("Known.scan3"); });
        registry.skipProbe(known);
        waitFor([&] { return !registry.isLauncherRunning(); });
        EXPECT_EQ(folder.read("Effects/VST3Configuration.xml").count("<Working>1</Working>"), 3);
        folder.write("Plugins/Known.vst3.script", "class Again\n");
        registry.Scan(true, false);
        waitFor([&] { return !registry.isLauncherRunning(); });
        EXPECT_EQ(folder.read("Effects/VST3Configuration.xml").count("<Name>Again<"), 1);
    }
}
