#include "Core/BaseLib/Log/DebuggerOutput.h"

void sendLineToDebugger(const QString &)
{
    // POSIX systems have no debugger channel; a debugger reads standard error like everybody else.
}
