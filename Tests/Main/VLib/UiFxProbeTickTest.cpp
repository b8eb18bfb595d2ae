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

// The label shows "before", the bar 24 of 0 to 100, before anything is posted.
const TickRow kTickRows[] = {
    {"nothing pending", [](VProgressDisplay &) {}, "before", 100, 24},
    {"of two texts the later is shown",
     [](VProgressDisplay &progress) {
         showStatus(L"one");
         progress.setText("two");
     },
     "two", 100, 24},
    {"status with a code", [](VProgressDisplay &) { showScanning("Fuzz"); }, "Scanning: Fuzz", 100, 24},
    {"a notification leaves text and bar alone",
     [](VProgressDisplay &) {
         showStatus(L"one");
         notifyUI(MessageCode::kEntryAdded);
     },
     "one", 100, 24},
    {"range of zero is never applied", [](VProgressDisplay &progress) { progress.setRange(0, "none"); },
     "none", 100, 24},
    {"range with an empty text keeps the text", [](VProgressDisplay &progress) { progress.setRange(30, ""); },
     "before", 30, 24},
    {"the range comes before the value",
     [](VProgressDisplay &progress) {
         progress.setValue(250);
         progress.setRange(300, "");
     },
     "before", 300, 250},
    {"begin sets no value", [](VProgressDisplay &progress) { progress.begin("begun", 60); }, "begun", 100,
     24},
    {"steps add to where it began",
     [](VProgressDisplay &progress) {
         progress.begin("begun", 60);
         progress.step(3);
         progress.step(-1);
     },
     "begun", 100, 62},
    {"finish does not move the bar",
     [](VProgressDisplay &progress) {
         progress.setRange(80, "");
         progress.finish();
     },
     "before", 80, 24},
    {"steps after finish count from the total",
     [](VProgressDisplay &progress) {
         progress.setRange(80, "");
         progress.finish();
         progress.step(-5);
     },
     "before", 80, 75},
    {"a step past the largest number stays there",
     [](VProgressDisplay &progress) {
         progress.setRange(INT_MAX, "");
         progress.begin("begun", INT_MAX - 1);
         progress.step(INT_MAX);
     },
     "begun", INT_MAX, INT_MAX},
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
}

TEST(UiFxProbeTick, ClosedWindowStaysAway)
{
    HeldScan scan;
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
