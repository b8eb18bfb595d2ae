#include "Main/AudioEngineController/Effects/Launcher/ScannerChild.h"

#include "Core/BaseLib/Log/FormatText.h"
#include "Core/BaseLib/Process/FaultGuard.h"

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
    const QString number = formatText(L"unhandled fault 0x%08X", status);
    const QString name = FaultCode::name(status);
    return name.isEmpty() ? number : QStringLiteral("%1 (%2)").arg(number, name);
}
