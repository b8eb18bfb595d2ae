#include "Tests/Scanner/posix/VirtualScreen.h"
#include "Tests/Support/ScanBench.h"

#include <QFile>

namespace {

const QString kTitle = "Quillon Audio FX";
const QString kComp = "Comp";

using NoScreen = ScanBench;

class OnScreen : public ScanBench {
protected:
    void SetUp() override
    {
        if (!m_screen.reasonAgainst().isEmpty())
            GTEST_SKIP() << qPrintable(m_screen.reasonAgainst());
        for (const char *other : {"WAYLAND_DISPLAY", "QT_QPA_PLATFORM"})
            m_scanner.removeEnvironment(other);
        m_scanner.setEnvironment("DISPLAY", m_screen.name());
        // The libraries of a real screen leak, partly from modules that are unloaded and so have no name to
        // suppress; the runs without a screen look for leaks of ours.
        m_scanner.setEnvironment("LSAN_OPTIONS", "detect_leaks=0");
    }
    bool waitForWindow()
    {
        return m_scanner.start() &&
               m_scanner.waitUntil([this] { return m_screen.windowTitled(kTitle) != 0; });
    }

    VirtualScreen m_screen;
    ScannerRun m_scanner{scannerProgram(), m_folder};
};

class LosingTheScreen : public OnScreen, public testing::WithParamInterface<const char *> {};

} // namespace

TEST_F(NoScreen, DoesNotKeepTheScannerFromItsWork)
{
    put(kComp + ".vst3");
    const QString nowhere = ":4711";
    const struct {
        const char *name;
        QString platform;
        QString display;
        QString wayland;
    } rows[] = {
        {"nothing is said", {}, {}, {}},
        {"a screen that is not there", {}, nowhere, {}},
        {"X11 with a screen that is not there", "xcb", nowhere, {}},
        {"Wayland without a compositor", {}, {}, "wayland-4711"},
        {"Wayland asked for by name", "wayland", {}, {}},
        {"a platform that nobody knows", "nonsense", {}, {}},
        {"offscreen", "offscreen", nowhere, {}},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        QFile::remove(cataloguePath());
        const ScannerOutcome outcome = scanOnce(
            {{"QT_QPA_PLATFORM", row.platform}, {"DISPLAY", row.display}, {"WAYLAND_DISPLAY", row.wayland}});
        EXPECT_TRUE(outcome.succeeded());
        EXPECT_EQ(outcome.standardError, "");
        EXPECT_EQ(records("Name"), QStringList(kComp));
    }
}

TEST_F(OnScreen, AWindowShowsAndItsCloseButtonCancels)
{
    put(kComp + ".vst3", "delay initialize 2000\n");
    put("Last.vst3");
    ASSERT_TRUE(waitForWindow());
    m_screen.requestClose(kTitle);
    EXPECT_TRUE(m_scanner.wait().succeeded());
    EXPECT_EQ(loaded(), QStringList(kComp));
    EXPECT_EQ(records("Name"), QStringList(kComp));
    EXPECT_EQ(m_folder.markers(), QStringList());
    EXPECT_GE(m_screen.takeAppeared(), 1);
}

TEST_F(OnScreen, WithNothingToProbeNoWindowAppears)
{
    put(kComp + ".vst3");
    scan();
    ASSERT_TRUE(m_scanner.start());
    EXPECT_TRUE(m_scanner.wait().succeeded());
    EXPECT_EQ(m_screen.takeAppeared(), 0);
}

TEST_F(OnScreen, TheWindowStaysOnTopOfOthers)
{
    if (!m_screen.startWindowManager())
        GTEST_SKIP() << "IceWM did not start";
    put(kComp + ".vst3", "delay initialize 3000\n");
    ASSERT_TRUE(m_scanner.start());
    EXPECT_TRUE(
        m_scanner.waitUntil([this] { return m_screen.isFocusedOnTop(m_screen.windowTitled(kTitle)); }));
}

TEST_F(OnScreen, TheWindowFollowsTheResolution)
{
    put(kComp + ".vst3", "delay initialize 500\n");
    const std::pair<int, QSize> rows[] = {
        {96, {333, 80}}, {100, {333, 80}}, {144, {500, 120}}, {192, {666, 160}}};
    for (const auto &[dotsPerInch, size] : rows) {
        m_screen.setResolution(dotsPerInch);
        QFile::remove(cataloguePath());
        ASSERT_TRUE(waitForWindow());
        EXPECT_EQ(m_screen.sizeOf(m_screen.windowTitled(kTitle)), size) << dotsPerInch;
        m_scanner.wait();
    }
}

TEST_P(LosingTheScreen, BlamesNobody)
{
    put("Before.vst3");
    scan();
    put(kComp + ".vst3", GetParam());
    ASSERT_TRUE(waitForWindow());
    m_screen.kill();
    EXPECT_TRUE(m_scanner.wait().succeeded());
    EXPECT_EQ(m_folder.markers(), QStringList());

    put(kComp + ".vst3");
    scan();
    EXPECT_EQ(records("Name Working"), QStringList({"Before|1", kComp + "|1"}));
}

INSTANTIATE_TEST_SUITE_P(Under, LosingTheScreen,
                         testing::Values("delay initialize 1000\n", "fault initialize hang\n"),
                         [](const auto &row) { return row.index == 0 ? "SlowPlugin" : "HangingPlugin"; });
