#include "Tests/Main/VLib/HeldScan.h"

#include "Main/VLib/VUI.h"
#include "Tests/Fixtures/FixturePlatform.h"
#include "Tests/Support/CapturedLog.h"

#include <gtest/gtest.h>

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
