#include "Main/AudioEngineController/Effects/Launcher/ScannerChild.h"

#include "Core/BaseLib/Log/FormatText.h"

#include <qt_windows.h>

ScannerChild::ScannerChild()
{
    setCreateProcessArgumentsModifier(
        [](QProcess::CreateProcessArguments *arguments) { arguments->flags |= CREATE_NEW_PROCESS_GROUP; });
}

void ScannerChild::setupChildProcess() {}

QString ScannerChild::crashText(int code)
{
    const auto status = static_cast<quint32>(code);
    const char *const text = status == EXCEPTION_ACCESS_VIOLATION ? " (access violation)"
                             : status == EXCEPTION_STACK_OVERFLOW ? " (stack overflow)"
                                                                  : "";
    return formatText(L"unhandled fault 0x%08X%s", status, text);
}
