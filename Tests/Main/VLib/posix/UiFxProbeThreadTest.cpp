#include "Tests/Main/VLib/HeldScan.h"

#include "Main/VLib/VUI.h"
#include "Tests/Support/CapturedLog.h"

#include <gtest/gtest.h>

#include <system_error>

#include <pthread.h>

TEST(UiFxProbeThread, ItsEndByAPluginEndsTheScan)
{
    const CapturedLog log;
    UiFxProbe dialog(QString(), [](const QString &) { pthread_exit(nullptr); });
    dialog.run(*QCoreApplication::instance(), false);
    EXPECT_EQ(log.lines(), QStringList("The scan's thread was ended by a plug-in"));
}

TEST(UiFxProbeThread, WithoutOneNothingStaysInstalled)
{
    pthread_attr_t normal;
    pthread_attr_t impossible;
    pthread_getattr_default_np(&normal);
    pthread_attr_init(&impossible);
    pthread_attr_setstacksize(&impossible, size_t(1) << 47);
    ASSERT_EQ(pthread_setattr_default_np(&impossible), 0);
    bool started = false;
    try {
        const UiFxProbe dialog(QString(), [&started](const QString &) { started = true; });
        ADD_FAILURE() << "no exception";
    } catch (const std::system_error &error) {
        EXPECT_EQ(error.code(), std::errc::resource_unavailable_try_again);
    }
    pthread_setattr_default_np(&normal);
    pthread_attr_destroy(&normal);
    EXPECT_FALSE(started);
    EXPECT_EQ(installedVUI(), nullptr);
}
