#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/ProcessSetup.h"
#include "Scanner/ScannerEntry.h"

#include <QApplication>

int main(int argc, char **argv)
{
    prepareProcess();
    configureLogFromEnvironment();
    int exitCode = 0;
    {
        QApplication application(argc, argv);
        settleLocale();
        exitCode = runScanner(application);
    }
    leaveProcess(exitCode);
}
