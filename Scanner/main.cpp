#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/ProcessSetup.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeChannel.h"
#include "Main/VLib/QtWarnings.h"
#include "Scanner/ProbeWorker.h"
#include "Scanner/ScannerEntry.h"
#include "Scanner/ScannerHelp.h"

#include <QApplication>

#include <cstring>

int main(int argc, char **argv)
{
    prepareProcess();
    if (argc > 1 && printHelp(argv[1]))
        leaveProcess(0);
    configureLogFromEnvironment();
    int exitCode = 0;
    if (argc > 1 && std::strcmp(argv[1], kProbeWorkerArgument) == 0) {
        QCoreApplication application(argc, argv);
        settleLocale();
        exitCode = runProbeWorker();
    } else {
        traceQtWarnings();
        // Sizes are those of an ordinary display; also 150% must give neither 100% nor 200%.
        QApplication::setAttribute(Qt::AA_EnableHighDpiScaling);
        QApplication::setHighDpiScaleFactorRoundingPolicy(Qt::HighDpiScaleFactorRoundingPolicy::PassThrough);
        QApplication application(argc, argv);
        settleLocale();
        exitCode = runScanner(application);
    }
    leaveProcess(exitCode);
}
