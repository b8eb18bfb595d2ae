#include "Tests/Main/VLib/HeldScan.h"

#include <QKeyEvent>
#include <QTimer>
#include <QWindow>

#include <gtest/gtest.h>

namespace {

/// What the close button of the window's frame does.
void pressCloseButton(UiFxProbe &dialog) { dialog.windowHandle()->close(); }

void pressEscape(UiFxProbe &dialog)
{
    QKeyEvent press(QEvent::KeyPress, Qt::Key_Escape, Qt::NoModifier);
    QCoreApplication::sendEvent(&dialog, &press);
}

void requestFromAnotherThread(HeldScan &scan)
{
    std::thread([&scan] { scan.dialog.requestClose(); }).join();
}

struct CloseRow {
    const char *name;
    bool defaultPath; ///< the window is shown at the first tick
    void (*close)(HeldScan &scan);
};

const CloseRow kCloseRows[] = {
    {"scan over, never shown", false, [](HeldScan &s) { s.finish(); }},
    {"scan over, in sight", true, [](HeldScan &s) { s.finish(); }},
    {"scan over, minimised", true, [](HeldScan &s) { s.dialog.showMinimized(), s.finish(); }},
    {"close button", true, [](HeldScan &s) { pressCloseButton(s.dialog); }},
    {"close button while minimised", true,
     [](HeldScan &s) { s.dialog.showMinimized(), pressCloseButton(s.dialog); }},
    {"Escape key", true, [](HeldScan &s) { pressEscape(s.dialog); }},
    {"closed, never shown", false, [](HeldScan &s) { s.dialog.close(); }},
    {"close requested by another thread, never shown", false, requestFromAnotherThread},
    {"close requested by another thread, in sight", true, requestFromAnotherThread},
};

/// Calls the row's action once the window is as the row wants it.
void closeWhenReady(HeldScan &scan, const CloseRow &row, QTimer &poll)
{
    QObject::connect(&poll, &QTimer::timeout, [&] {
        if (scan.dialog.isVisible() != row.defaultPath)
            return;
        poll.stop();
        row.close(scan);
    });
    poll.start(1);
}

} // namespace

TEST(UiFxProbeClose, EndsTheEventLoop)
{
    // A window of some plug-in must not keep the scanner alive.
    QWidget stranger;
    stranger.show();
    for (const CloseRow &row : kCloseRows) {
        SCOPED_TRACE(row.name);
        HeldScan scan;
        QTimer poll;
        closeWhenReady(scan, row, poll);
        scan.dialog.run(*QCoreApplication::instance(), row.defaultPath);
        EXPECT_FALSE(poll.isActive());
        EXPECT_FALSE(scan.dialog.isVisible());
        EXPECT_TRUE(stranger.isVisible());
    }
}

TEST(UiFxProbeClose, ScanThatIsOverAtOnceIsNeverShown)
{
    UiFxProbe dialog(QString(), [](const QString &) { requestShow(); });
    while (!dialog.isFinished())
        std::this_thread::yield();
    dialog.run(*QCoreApplication::instance(), false);
    EXPECT_FALSE(dialog.isVisible());
    EXPECT_FALSE(dialog.testAttribute(Qt::WA_WState_ExplicitShowHide));
}
