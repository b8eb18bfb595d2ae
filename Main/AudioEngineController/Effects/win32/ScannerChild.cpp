#include "Main/AudioEngineController/Effects/ScannerChild.h"

#include "Core/BaseLib/FormatText.h"

#include <qt_windows.h>

ScannerChild::ScannerChild()
{
    setCreateProcessArgumentsModifier(
        [](QProcess::CreateProcessArguments *arguments) { arguments->flags |= CREATE_NEW_PROCESS_GROUP; });
}

ScannerChild::~ScannerChild()
{
    if (m_job)
        CloseHandle(m_job);
}

void ScannerChild::setupChildProcess() {}

void ScannerChild::tieToThisProcess()
{
    m_job = CreateJobObjectW(nullptr, nullptr);
    if (!m_job)
        return;
    JOBOBJECT_EXTENDED_LIMIT_INFORMATION limits = {};
    limits.BasicLimitInformation.LimitFlags = JOB_OBJECT_LIMIT_KILL_ON_JOB_CLOSE;
    SetInformationJobObject(m_job, JobObjectExtendedLimitInformation, &limits, sizeof limits);
    HANDLE process =
        OpenProcess(PROCESS_SET_QUOTA | PROCESS_TERMINATE, FALSE, static_cast<DWORD>(processId()));
    if (!process)
        return;
    AssignProcessToJobObject(m_job, process);
    CloseHandle(process);
}

QString ScannerChild::crashText(int code)
{
    const auto status = static_cast<quint32>(code);
    const char *const text = status == EXCEPTION_ACCESS_VIOLATION ? " (access violation)"
                             : status == EXCEPTION_STACK_OVERFLOW ? " (stack overflow)"
                                                                  : "";
    return formatText(L"unhandled fault 0x%08X%s", status, text);
}
