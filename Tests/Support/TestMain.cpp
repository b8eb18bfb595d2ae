#include "Core/BaseLib/ProcessSetup.h"

#include <QCoreApplication>

#include <gtest/gtest.h>

// Tests need an application object (folders, event loops) but no screen.
int main(int argc, char **argv)
{
    prepareProcess();
    ::testing::InitGoogleTest(&argc, argv);
    const QCoreApplication application(argc, argv);
    settleLocale();
    return RUN_ALL_TESTS();
}
