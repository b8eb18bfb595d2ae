#include "Tests/Scanner/ScannerTest.h"
#include "Tests/Scanner/posix/VirtualScreen.h"

#include <QFile>

namespace {

const QString kTitle = QStringLiteral("Quillon Audio FX");
const QString kComp = QStringLiteral("Comp");
const QString kLast = QStringLiteral("Last");

/// Takes away what tells a program of a screen.
void removeScreen(ScannerRun &scanner)
{
    for (const char *name : {"DISPLAY", "WAYLAND_DISPLAY", "QT_QPA_PLATFORM"})
        scanner.removeEnvironment(QLatin1String(name));
}

using NoScreen = ScannerTest;

class OnScreen : public ScannerTest {
protected:
    void SetUp() override
    {
        if (!m_screen.reasonAgainst().isEmpty())
            GTEST_SKIP() << qPrintable(m_screen.reasonAgainst());
        removeScreen(m_scanner);
        m_scanner.setEnvironment(QStringLiteral("DISPLAY"), m_screen.name());
        // The libraries of a real screen leak, partly from modules that are unloaded and so have no name to
        // suppress; the runs without a screen look for leaks of ours.
        m_scanner.setEnvironment(QStringLiteral("LSAN_OPTIONS"), QStringLiteral("detect_leaks=0"));
    }
    bool waitForWindow()
    {
        return m_scanner.start() &&
               m_scanner.waitUntil([this] { return m_screen.visibleTitles().contains(kTitle); });
    }

    VirtualScreen m_screen;
    ScannerRun m_scanner{scannerProgram(), m_folder};
};

class LosingTheScreen : public OnScreen, public testing::WithParamInterface<const char *> {};

} // namespace

TEST_F(NoScreen, DoesNotKeepTheScannerFromItsWork)
{
    addModule(kComp);
    const QString nowhere = QStringLiteral(":4711");
    const struct {
        const char *name;
        QString platform;
        QString display;
        QString wayland;
    } rows[] = {
        {"nothing is said", {}, {}, {}},
        {"a screen that is not there", {}, nowhere, {}},
        {"a screen's name that is none", {}, QStringLiteral("\xC3\xA4"), {}},
        {"X11 without a screen", QStringLiteral("xcb"), {}, {}},
        {"X11 with a screen that is not there", QStringLiteral("xcb"), nowhere, {}},
        {"Wayland without a compositor", {}, {}, QStringLiteral("wayland-4711")},
        {"Wayland asked for by name", QStringLiteral("wayland"), {}, {}},
        {"a platform that nobody knows", QStringLiteral("nonsense"), {}, {}},
        {"offscreen", QStringLiteral("offscreen"), nowhere, {}},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        QFile::remove(cataloguePath());
        ScannerRun scanner(scannerProgram(), m_folder);
        removeScreen(scanner);
        for (const auto &[name, value] :
             {std::pair("QT_QPA_PLATFORM", row.platform), std::pair("DISPLAY", row.display),
              std::pair("WAYLAND_DISPLAY", row.wayland)})
            if (!value.isNull())
                scanner.setEnvironment(QLatin1String(name), value);
        EXPECT_TRUE(scanner.run().succeeded());
        EXPECT_EQ(listed(), QStringList(kComp));
    }
}

TEST_F(OnScreen, AWindowShowsAndItsCloseButtonCancels)
{
    addModule(kComp, "delay initialize 2000\n");
    addModule(kLast);
    ASSERT_TRUE(waitForWindow());
    EXPECT_EQ(m_screen.sizeOf(kTitle), QStringLiteral("333x80"));
    m_screen.requestClose(kTitle);
    EXPECT_TRUE(m_scanner.wait().succeeded());
    EXPECT_EQ(loaded(), QStringList(kComp));
    EXPECT_EQ(listed(), QStringList(kComp));
    EXPECT_EQ(m_folder.markers(), QStringList());
    EXPECT_GE(m_screen.takeAppeared(), 1);
}

TEST_F(OnScreen, WithNothingToProbeNoWindowAppears)
{
    addListedModules({kComp});
    ASSERT_TRUE(m_scanner.start());
    EXPECT_TRUE(m_scanner.wait().succeeded());
    EXPECT_EQ(m_screen.takeAppeared(), 0);
}

TEST_P(LosingTheScreen, BlamesNobody)
{
    addListedModules({QStringLiteral("Before")});
    addModule(kComp, GetParam());
    ASSERT_TRUE(waitForWindow());
    m_screen.kill();
    EXPECT_TRUE(m_scanner.wait().succeeded());
    EXPECT_EQ(m_folder.markers(), QStringList());

    addModule(kComp);
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(listed(), QStringList({QStringLiteral("Before"), kComp}));
    EXPECT_TRUE(records()[kComp].working);
}

INSTANTIATE_TEST_SUITE_P(Under, LosingTheScreen,
                         testing::Values("delay initialize 1000\n", "fault initialize hang\n"),
                         [](const auto &row) { return row.index == 0 ? "SlowPlugin" : "HangingPlugin"; });
