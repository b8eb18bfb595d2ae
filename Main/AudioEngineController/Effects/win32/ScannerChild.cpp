#include "Main/AudioEngineController/Effects/ScannerChild.h"

#include "Core/BaseLib/FormatText.h"

#include <QProcessEnvironment>

#include <qt_windows.h>

ScannerChild::ScannerChild()
{
    setCreateProcessArgumentsModifier(
        [](QProcess::CreateProcessArguments *arguments) { arguments->flags |= CREATE_NEW_PROCESS_GROUP; });
    // The scanner waits for the end of that process. A job object would do it as well, but would end the
    // scanner in the middle of a probe, whose plug-in would be blamed, and with it whatever plug-ins have
    // started.
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    environment.insert(QStringLiteral("FXPROBE_PARENT"), QString::number(GetCurrentProcessId()));
    setProcessEnvironment(environment);
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
