#include "Core/BaseLib/Log/DebuggerOutput.h"

void sendLineToDebugger(const QString &)
{
    // POSIX systems have no debugger channel; a debugger shows standard error.
}
