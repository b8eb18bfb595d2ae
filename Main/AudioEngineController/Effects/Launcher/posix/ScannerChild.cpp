#include "Main/AudioEngineController/Effects/Launcher/ScannerChild.h"

#include <csignal>
#include <cstring>

#include <sys/prctl.h>
#include <unistd.h>

ScannerChild::ScannerChild() = default;

void ScannerChild::setupChildProcess()
{
    setpgid(0, 0);
    // Sent when the thread that started the scanner ends, be it with the whole process: at once, but a
    // plug-in may have taken the signal for itself.
    prctl(PR_SET_PDEATHSIG, SIGTERM);
}

// NOTE: Qt documents no exit code for a crashed process; on these platforms Qt 5 puts the signal there.
QString ScannerChild::crashText(int code)
{
    return QStringLiteral("signal %1 (%2)").arg(code).arg(QString::fromLocal8Bit(strsignal(code)));
}
