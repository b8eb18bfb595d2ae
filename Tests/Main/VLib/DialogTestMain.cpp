#include "Core/BaseLib/Process/ProcessSetup.h"

#include <QApplication>

#include <gtest/gtest.h>

// Qt is not built for the sanitizers: the locks in its event queue go unseen, and the system's font
// library keeps what it read. Nothing of ours is covered by these.
#if defined(__SANITIZE_THREAD__)
extern "C" __attribute__((visibility("default"))) const char *__tsan_default_suppressions()
{
    return "called_from_lib:libQt5Core.so\n";
}
#elif defined(__SANITIZE_ADDRESS__)
extern "C" __attribute__((visibility("default"))) const char *__lsan_default_suppressions()
{
    return "leak:libfontconfig\n";
}
#endif

// Windows without a screen, unless somebody wants to watch.
int main(int argc, char **argv)
{
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
        qputenv("QT_QPA_PLATFORM", "offscreen");
    prepareProcess();
    ::testing::InitGoogleTest(&argc, argv);
    const QApplication application(argc, argv);
    settleLocale();
    // The application object stays: the offscreen platform leaks its screen when it goes.
    leaveProcess(RUN_ALL_TESTS());
}
