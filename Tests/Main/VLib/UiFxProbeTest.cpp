#include "Main/VLib/UiFxProbe.h"

#include "Core/BaseLib/Process/ManualResetEvent.h"
#include "Main/VLib/SimpleGUI.h"
#include "Main/VLib/VProgressDisplay.h"
#include "Main/VLib/VUI.h"
#include "Tests/Fixtures/FixturePlatform.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/QtPrinters.h"

#include <QCoreApplication>
#include <QFontDatabase>
#include <QKeyEvent>
#include <QLabel>
#include <QProgressBar>
#include <QTimer>
#include <QWindow>

#include <gtest/gtest.h>

#include <climits>

namespace {

/// A window whose scan does nothing until it is let go, so that a test decides what each tick finds.
class HeldScan {
public:
    HeldScan()
        : dialog(QString(), [this](const QString &) { m_letGo.waitFor(std::chrono::hours(1)); })
    {}
    ~HeldScan() { m_letGo.set(); }

    /// Lets the scan end and waits for it.
    void finish()
    {
        m_letGo.set();
        while (!dialog.isFinished())
            std::this_thread::yield();
    }
    void tick() { QMetaObject::invokeMethod(&dialog, "OnTimer"); }
    QLabel &label() const { return *dialog.findChild<QLabel *>("label"); }
    QProgressBar &bar() const { return *dialog.findChild<QProgressBar *>("progressBar"); }

private:
    ManualResetEvent m_letGo;

public:
    UiFxProbe dialog;
};

void pressEscape(HeldScan &scan)
{
    QKeyEvent press(QEvent::KeyPress, Qt::Key_Escape, Qt::NoModifier);
    QCoreApplication::sendEvent(&scan.dialog, &press);
}

const struct {
    const char *name;
    bool isShown; ///< at the first tick
    void (*close)(HeldScan &scan);
} kClosings[] = {
    {"scan over, never shown", false, [](HeldScan &s) { s.finish(); }},
    {"scan over, minimised", true, [](HeldScan &s) { s.dialog.showMinimized(), s.finish(); }},
    {"close button of the frame", true, [](HeldScan &s) { s.dialog.windowHandle()->close(); }},
    {"Escape key", true, pressEscape},
    {"closed, never shown", false, [](HeldScan &s) { s.dialog.close(); }},
    {"request of another thread", false,
     [](HeldScan &s) { std::thread([&s] { s.dialog.requestClose(); }).join(); }},
};

using Progress = VProgressDisplay;

// The label shows "before", the bar 24 of 0 to 100, before anything is posted.
const struct {
    const char *name;
    void (*act)(Progress &progress);
    QString text;
    int maximum, value;
} kPosts[] = {
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

TEST(UiFxProbeClose, EndsTheEventLoop)
{
    QWidget other; // a plug-in's window must not keep the scanner alive
    other.show();
    for (const auto &row : kClosings) {
        HeldScan scan;
        QTimer poll, deadline;
        QObject::connect(&poll, &QTimer::timeout, [&] {
            if (scan.dialog.isVisible() != row.isShown)
                return;
            poll.stop();
            row.close(scan);
        });
        QObject::connect(&deadline, &QTimer::timeout, [] { QCoreApplication::exit(); });
        poll.start(1);
        deadline.setSingleShot(true);
        deadline.start(20000);
        scan.dialog.run(*QCoreApplication::instance(), row.isShown);
        EXPECT_TRUE(deadline.isActive()) << row.name << ": the loop went on";
        EXPECT_FALSE(scan.dialog.isVisible()) << row.name;
    }
}

TEST(UiFxProbeScan, IsCancelledAndItsMessagesAreAnsweredWhenTheWindowGoes)
{
    int answered = 0;
    {
        UiFxProbe dialog(QString(), [&dialog, &answered](const QString &) {
            const auto progress = createProgressDisplay();
            while (!progress->isCancelled())
                std::this_thread::yield();
            for (int message = 0; message < 100; ++message)
                answered += QMetaObject::invokeMethod(&dialog, "update", Qt::BlockingQueuedConnection);
        });
        dialog.requestClose();
        QCoreApplication::processEvents();
        dialog.run(*QCoreApplication::instance(), true); // returns at once: it is closed already
        EXPECT_FALSE(dialog.isVisible());
    }
    EXPECT_EQ(answered, 100);
}

TEST(UiFxProbeScan, EndsWhateverItThrowsAndWhenAPluginEndsItsThread)
{
    using Scan = std::function<void(const QString &)>;
    const Scan scans[] = {[](const QString &) { throw std::runtime_error("broken"); },
                          [](const QString &) { throw 5; }, nullptr, [](const QString &) { endThread(); }};
    for (const Scan &scan : scans) {
        const CapturedLog log;
        UiFxProbe dialog(QString(), scan);
        dialog.run(*QCoreApplication::instance(), false);
        EXPECT_TRUE(dialog.isFinished());
        EXPECT_EQ(log.lines().size(), 1) << "the log says why";
    }
}

TEST(UiFxProbeScan, NobodyReachesAWindowThatIsGone)
{
    std::shared_ptr<VUI> ui;
    std::shared_ptr<VProgressDisplay> progress;
    {
        const HeldScan scan;
        ui = installedVUI();
        progress = createProgressDisplay();
        EXPECT_FALSE(progress->isCancelled());
    }
    EXPECT_EQ(installedVUI(), nullptr);
    ui->showStatus("anybody there?");
    progress->setRange(5, "hello?");
    EXPECT_TRUE(progress->isCancelled());
}

TEST(UiFxProbeTick, ShowsWhatIsPending)
{
    for (const auto &row : kPosts) {
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
    EXPECT_TRUE(scan.dialog.windowFlags() & Qt::WindowStaysOnTopHint);
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
