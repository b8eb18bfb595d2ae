#include "Core/BaseLib/Process/ProcessSetup.h"

#include <QCoreApplication>

#include <gtest/gtest.h>

// Tests need an application object (folders, event loops) but no screen.
int main(int argc, char **argv)
{
    prepareProcess();
    ::testing::InitGoogleTest(&argc, argv);
    const QCoreApplication application(argc, argv);
    settleLocale();
    // Modules that stayed mapped have nothing to say any more, as in the scanner.
    leaveProcess(RUN_ALL_TESTS());
}
