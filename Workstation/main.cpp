#include "Core/BaseLib/Process/ProcessSetup.h"
#include "Workstation/FxScan.h"
#include "Workstation/Output/Terminal.h"

#include <QCoreApplication>

int main(int argc, char **argv)
{
    prepareProcess();
    int exitCode = ScanExit::kDone;
    {
        QCoreApplication application(argc, argv);
        QCoreApplication::setApplicationName(QStringLiteral("fxscan"));
        QCoreApplication::setApplicationVersion(QStringLiteral(FXPROBE_VERSION));
        settleLocale();
        const CommandLine line = readCommandLine(QCoreApplication::arguments());
        if (line.goesOn()) {
            exitCode = runFxScan(line.options);
        } else {
            (line.isError ? Terminal::printError : Terminal::print)(line.text);
            exitCode = line.isError ? ScanExit::kUsage : ScanExit::kDone;
        }
    }
    // Plug-ins that were loaded into this process may have stayed.
    leaveProcess(exitCode);
}
