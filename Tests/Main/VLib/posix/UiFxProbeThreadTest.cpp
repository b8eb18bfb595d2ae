#include "Tests/Main/VLib/HeldScan.h"
#include "Tests/Support/CapturedLog.h"

#include <gtest/gtest.h>

#include <pthread.h>

TEST(UiFxProbeThread, ItsEndByAPluginEndsTheScan)
{
    const CapturedLog log;
    UiFxProbe dialog(QString(), [](const QString &) { pthread_exit(nullptr); });
    dialog.run(*QCoreApplication::instance(), false);
    EXPECT_EQ(log.lines(), QStringList("The scan's thread was ended by a plug-in"));
}
