#include "Tests/Main/VLib/HeldScan.h"

#include <gtest/gtest.h>

#include <climits>

namespace {

struct TickRow {
    const char *name;
    void (*act)(VProgressDisplay &progress);
    QString text;
    int maximum;
    int value;
};

using Progress = VProgressDisplay;

// The label shows "before", the bar 24 of 0 to 100, before anything is posted.
const TickRow kTickRows[] = {
    {"nothing pending", [](Progress &) {}, "before", 100, 24},
    {"the later of two texts", [](Progress &p) { showStatus(L"1"), p.setText("two"); }, "two", 100, 24},
    {"status with a code", [](Progress &) { showScanning("Fuzz"); }, "Scanning: Fuzz", 100, 24},
    {"a notification leaves text and bar alone",
     [](Progress &) { showStatus(L"one"), notifyUI(MessageCode::kEntryAdded); }, "one", 100, 24},
    {"range of zero is never applied", [](Progress &p) { p.setRange(0, "none"); }, "none", 100, 24},
    {"range with an empty text", [](Progress &p) { p.setRange(30, ""); }, "before", 30, 24},
    {"range before value", [](Progress &p) { p.setValue(250), p.setRange(300, ""); }, "before", 300, 250},
    {"begin sets no value", [](Progress &p) { p.begin("begun", 60); }, "begun", 100, 24},
    {"steps", [](Progress &p) { p.begin("begun", 60), p.step(3), p.step(-1); }, "begun", 100, 62},
    {"finish moves no bar", [](Progress &p) { p.setRange(80, ""), p.finish(); }, "before", 80, 24},
    {"steps after finish count from the total",
     [](Progress &p) { p.setRange(80, ""), p.finish(), p.step(-5); }, "before", 80, 75},
    {"a step past the largest number stays there",
     [](Progress &p) { p.setRange(INT_MAX, ""), p.begin("begun", INT_MAX - 1), p.step(INT_MAX); }, "begun",
     INT_MAX, INT_MAX},
};

} // namespace

TEST(UiFxProbeTick, ShowsWhatIsPending)
{
    for (const TickRow &row : kTickRows) {
        SCOPED_TRACE(row.name);
        HeldScan scan;
        showStatus(L"before");
        scan.tick();
        row.act(*createProgressDisplay());
        scan.tick();
        EXPECT_EQ(scan.text(), row.text);
        EXPECT_EQ(scan.bar().minimum(), 0);
        EXPECT_EQ(scan.bar().maximum(), row.maximum);
        EXPECT_EQ(scan.bar().value(), row.value);
    }
}

TEST(UiFxProbeTick, MinusOneIsNoValueEvenWhereTheBarHasIt)
{
    HeldScan scan;
    scan.dialog.setRange(-10, 50);
    createProgressDisplay()->setValue(-1);
    scan.tick();
    EXPECT_EQ(scan.bar().minimum(), -10);
    EXPECT_EQ(scan.bar().value(), 24);
}

TEST(UiFxProbeTick, TextThatLooksLikeHTMLIsShownAsItIs)
{
    HeldScan scan;
    const auto &label = *scan.dialog.findChild<QLabel *>("label");
    const auto widthOf = [&](const QString &text) {
        scan.dialog.setText(text);
        scan.tick();
        return label.sizeHint().width();
    };
    const int plain = widthOf("x");
    EXPECT_GT(widthOf("<b>x</b>"), 4 * plain);
}

TEST(UiFxProbeTick, FinishedWinsOverEverythingElse)
{
    HeldScan scan;
    showScanning("last words");
    createProgressDisplay()->setValue(99);
    scan.finish();
    scan.tick();
    EXPECT_EQ(scan.text(), QString());
    EXPECT_EQ(scan.bar().value(), 24);
    EXPECT_FALSE(scan.dialog.isVisible());
}

TEST(UiFxProbeTick, ShowsTheWindowOnceWhenAsked)
{
    HeldScan scan;
    scan.dialog.setWindowState(Qt::WindowMinimized);
    scan.tick();
    EXPECT_FALSE(scan.dialog.isVisible());
    requestShow();
    scan.tick();
    EXPECT_TRUE(scan.dialog.isVisible());
    EXPECT_FALSE(scan.dialog.isMinimized());

    // Whoever puts it away does not want it back with the next plug-in.
    scan.dialog.showMinimized();
    requestShow();
    scan.tick();
    EXPECT_TRUE(scan.dialog.isMinimized());
    scan.dialog.close();
    requestShow();
    scan.tick();
    EXPECT_FALSE(scan.dialog.isVisible());
}

TEST(UiFxProbeTick, LongTextsDoNotWidenTheWindow)
{
    HeldScan scan;
    showStatus(L"%ls", QString(550, 'W'));
    requestShow();
    scan.tick();
    EXPECT_EQ(scan.dialog.size(), QSize(333, 80));
    EXPECT_EQ(scan.bar().geometry().left(), 20);
    EXPECT_EQ(scan.bar().geometry().right(), 332 - 20);
    EXPECT_EQ(scan.bar().geometry().bottom(), 79 - 20);
}

TEST(UiFxProbeTick, WindowHasItsTitleAndButtons)
{
    const HeldScan scan;
    EXPECT_EQ(scan.dialog.objectName(), "FxProbeClass");
    EXPECT_EQ(scan.dialog.windowTitle(), "Quillon Audio FX");
    // With buttons asked for, the toolkit adds title bar and system menu by itself.
    const auto added = Qt::WindowTitleHint | Qt::WindowSystemMenuHint;
    EXPECT_EQ(scan.dialog.windowFlags() & ~added, Qt::WindowFlags(0x8044001));
}
