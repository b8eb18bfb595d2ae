#include "Tests/Main/VLib/HeldScan.h"

#include "Tests/Support/QtPrinters.h"

#include <QFontDatabase>

#include <gtest/gtest.h>

#include <climits>

namespace {

using Progress = VProgressDisplay;

// The label shows "before", the bar 24 of 0 to 100, before anything is posted.
const struct {
    const char *name;
    void (*act)(Progress &progress);
    QString text;
    int maximum, value;
} kRows[] = {
    {"the later of two texts", [](Progress &p) { showStatus(L"1"), p.setText("two"); }, "two", 100, 24},
    {"a notification leaves text and bar alone", [](Progress &) { notifyUI(5); }, "before", 100, 24},
    {"range of zero is never applied", [](Progress &p) { p.setRange(0, "none"); }, "none", 100, 24},
    {"range before value", [](Progress &p) { p.setValue(250), p.setRange(300, ""); }, "before", 300, 250},
    {"minus one is no value", [](Progress &p) { p.setValue(-1); }, "before", 100, 24},
    {"finish moves no bar", [](Progress &p) { p.setRange(80, ""), p.finish(); }, "before", 80, 24},
    {"steps count from the total afterwards", [](Progress &p) { p.setRange(80, ""), p.finish(), p.step(-5); },
     "before", 80, 75},
    {"a step past the largest number stays there",
     [](Progress &p) { p.setRange(INT_MAX, ""), p.begin("b", INT_MAX - 1), p.step(9); }, "b", INT_MAX,
     INT_MAX},
};

} // namespace

TEST(UiFxProbeTick, ShowsWhatIsPending)
{
    for (const auto &row : kRows) {
        HeldScan scan;
        showStatus(L"before");
        scan.tick();
        row.act(*createProgressDisplay());
        scan.tick();
        EXPECT_EQ(scan.label().text(), row.text) << row.name;
        EXPECT_EQ(scan.bar().maximum(), row.maximum) << row.name;
        EXPECT_EQ(scan.bar().value(), row.value) << row.name;
    }
}

TEST(UiFxProbeTick, LongAndOddTextsAreShownAsTheyAre)
{
    HeldScan scan;
    const auto widthOf = [&](const QString &text) {
        scan.dialog.setText(text);
        requestShow();
        scan.tick();
        EXPECT_EQ(scan.dialog.size(), QSize(333, 80));
        return scan.label().sizeHint().width();
    };
    const int plain = widthOf("x");
    EXPECT_GT(widthOf("<b>x</b>"), 4 * plain) << "markup in a name is a part of the name";
    EXPECT_GT(widthOf(QString(550, 'W')), 333);
}

TEST(UiFxProbeTick, ATextThatIsTooLongKeepsItsEnd)
{
    if (QFontDatabase().families().isEmpty())
        GTEST_SKIP() << "without fonts all letters look alike";
    HeldScan scan;
    const auto picture = [&](const QString &text) {
        scan.label().setText(text);
        return scan.label().grab().toImage();
    };
    for (const QString &name : {QString("Shelving EQ ").repeated(40), QString("\u97F3\u91CF").repeated(200)})
        EXPECT_NE(picture(name + "A"), picture(name + "B")) << qPrintable(name);
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
    // Whatever else is pending when the scan is over.
    showScanning("last words");
    scan.finish();
    scan.tick();
    EXPECT_EQ(scan.label().text(), QString());
    EXPECT_FALSE(scan.dialog.isVisible());
}
