#include "Tests/Main/VLib/HeldScan.h"

#include "Main/VLib/VUI.h"
#include "Tests/Fixtures/FixturePlatform.h"
#include "Tests/Support/CapturedLog.h"

#include <gtest/gtest.h>

namespace {

/// A scan that goes on until its window asks it to stop.
void scanUntilCancelled()
{
    const auto progress = createProgressDisplay();
    while (!progress->isCancelled())
        std::this_thread::yield();
}

QString logAfterScan(std::function<void(const QString &)> scanRun)
{
    const CapturedLog log;
    UiFxProbe dialog(QString(), std::move(scanRun));
    dialog.run(*QCoreApplication::instance(), false);
    return log.lines().join('\n');
}

} // namespace

TEST(UiFxProbeScan, IsCancelledWhenTheWindowGoesAlsoBeforeTheLoopStarts)
{
    bool over = false;
    {
        UiFxProbe dialog(QString(), [&over](const QString &) {
            scanUntilCancelled();
            over = true;
        });
        dialog.requestClose();
        QCoreApplication::processEvents();
        dialog.run(*QCoreApplication::instance(), true);
        EXPECT_FALSE(dialog.isVisible());
    }
    EXPECT_TRUE(over);
}

TEST(UiFxProbeScan, MessagesToTheWindowAreAnsweredWhileItGoes)
{
    int answered = 0;
    {
        UiFxProbe dialog(QString(), [&dialog, &answered](const QString &) {
            scanUntilCancelled();
            for (int message = 0; message < 100; ++message)
                answered +=
                    QMetaObject::invokeMethod(&dialog, "update", Qt::BlockingQueuedConnection) ? 1 : 0;
        });
    }
    EXPECT_EQ(answered, 100);
}

TEST(UiFxProbeScan, EndsWhateverItThrows)
{
    EXPECT_EQ(logAfterScan([](const QString &) {}), QString());
    EXPECT_EQ(logAfterScan([](const QString &) { throw std::runtime_error("100% broken"); }),
              "The scan ended with an exception: 100* broken");
    EXPECT_EQ(logAfterScan([](const QString &) { throw 5; }), "The scan ended with an unknown exception");
    EXPECT_EQ(logAfterScan(nullptr), "The scan ended with an exception: bad_function_call");
}

TEST(UiFxProbeScan, EndsWithItsThreadThatAPluginEnds)
{
    EXPECT_EQ(logAfterScan([](const QString &) { endThread(); }), "The scan's thread was ended by a plug-in");
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
    ui->requestShow();
    progress->setRange(5, "hello?");
    EXPECT_TRUE(progress->isCancelled());
}

// Meant for the thread sanitizer above all.
TEST(UiFxProbeScan, TextAndRangeStayTogetherWhileTheWindowTicks)
{
    constexpr int kRounds = 2000;
    ManualResetEvent seen;
    UiFxProbe dialog(QString(), [&seen](const QString &) {
        const auto progress = createProgressDisplay();
        for (int round = 1; round <= kRounds; ++round) {
            progress->setRange(round, QString::number(round));
            progress->setValue(round);
            requestShow();
            notifyUI(MessageCode::kEntryAdded);
        }
        seen.waitFor(std::chrono::minutes(1));
    });
    const auto &label = *dialog.findChild<QLabel *>("label");
    const auto &bar = *dialog.findChild<QProgressBar *>("progressBar");
    while (bar.value() != kRounds) {
        QMetaObject::invokeMethod(&dialog, "OnTimer");
        if (!label.text().isEmpty()) {
            ASSERT_EQ(label.text().toInt(), bar.maximum());
        }
    }
    // The tick that took the last value may have looked for the wish to be shown before there was one.
    QMetaObject::invokeMethod(&dialog, "OnTimer");
    EXPECT_TRUE(dialog.isVisible());
    seen.set();
}
