#include "Tests/Main/VLib/HeldScan.h"

#include "Tests/Support/CapturedLog.h"

#include <windows.h>

#include <gtest/gtest.h>

TEST(UiFxProbeThread, ItsEndByAPluginEndsTheScan)
{
    const CapturedLog log;
    UiFxProbe dialog(QString(), [](const QString &) { ExitThread(0); });
    dialog.run(*QCoreApplication::instance(), false);
    EXPECT_EQ(log.lines(), QStringList("The scan's thread was ended by a plug-in"));
}
