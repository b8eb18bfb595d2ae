#include "Tests/Main/VLib/HeldScan.h"

#include <QKeyEvent>
#include <QTimer>
#include <QWindow>

#include <gtest/gtest.h>

namespace {

void pressEscape(HeldScan &scan)
{
    QKeyEvent press(QEvent::KeyPress, Qt::Key_Escape, Qt::NoModifier);
    QCoreApplication::sendEvent(&scan.dialog, &press);
}

const struct {
    const char *name;
    bool isShown; ///< at the first tick
    void (*close)(HeldScan &scan);
} kRows[] = {
    {"scan over, never shown", false, [](HeldScan &s) { s.finish(); }},
    {"scan over, minimised", true, [](HeldScan &s) { s.dialog.showMinimized(), s.finish(); }},
    {"close button of the frame", true, [](HeldScan &s) { s.dialog.windowHandle()->close(); }},
    {"Escape key", true, pressEscape},
    {"closed, never shown", false, [](HeldScan &s) { s.dialog.close(); }},
    {"request of another thread", false,
     [](HeldScan &s) { std::thread([&s] { s.dialog.requestClose(); }).join(); }},
};

} // namespace

TEST(UiFxProbeClose, EndsTheEventLoop)
{
    QWidget other; // a plug-in's window must not keep the scanner alive
    other.show();
    for (const auto &row : kRows) {
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
