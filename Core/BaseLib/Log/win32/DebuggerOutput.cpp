#include "Core/BaseLib/Log/DebuggerOutput.h"

#include <windows.h>

void sendLineToDebugger(const QString &line)
{
    OutputDebugStringW(reinterpret_cast<const wchar_t *>(line.utf16()));
    OutputDebugStringW(L"\n");
}
