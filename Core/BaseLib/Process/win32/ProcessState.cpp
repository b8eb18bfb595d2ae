#include "Core/BaseLib/Process/ProcessState.h"

#include "Core/BaseLib/Files/win32/WindowsText.h"
#include "Core/BaseLib/Log/DebugLog.h"

#include <cfenv>
#include <clocale>
#include <csignal>
#include <cstdlib>
#include <map>
#include <string>

#include <objbase.h>
#include <xmmintrin.h>

namespace {

constexpr int kSignals[] = {SIGABRT, SIGFPE, SIGILL, SIGSEGV, SIGTERM};

using SignalHandler = void (*)(int);

/// What the system tells through a call that takes a buffer and its size and gives the length.
template <typename Call>
std::wstring textOf(Call call)
{
    std::wstring text(call(0, nullptr), L'\0');
    text.resize(call(static_cast<DWORD>(text.size()), text.data()));
    return text;
}

std::wstring workingFolder() { return textOf(GetCurrentDirectoryW); }

/// Empty when none was set.
std::wstring libraryFolder() { return textOf(GetDllDirectoryW); }

template <typename Setter>
auto currentOf(Setter set)
{
    const auto current = set(nullptr);
    set(current);
    return current;
}

bool hasApartment()
{
    APTTYPE type = {};
    APTTYPEQUALIFIER qualifier = {};
    return CoGetApartmentType(&type, &qualifier) == S_OK && qualifier != APTTYPEQUALIFIER_IMPLICIT_MTA;
}

} // namespace

struct ProcessState::Snapshot {
    UINT errorMode = GetErrorMode();
    DWORD threadErrorMode = GetThreadErrorMode();
    LPTOP_LEVEL_EXCEPTION_FILTER unhandled = currentOf(SetUnhandledExceptionFilter);
    _invalid_parameter_handler invalidParameter = currentOf(_set_invalid_parameter_handler);
    int crtErrorMode = _set_error_mode(_REPORT_ERRMODE);
    std::map<int, SignalHandler> signalHandlers;
    std::wstring folder = workingFolder();
    std::wstring libraries = libraryFolder();
    std::string locale = std::setlocale(LC_ALL, nullptr);
    LCID threadLocale = GetThreadLocale();
    bool apartment = hasApartment();
    std::fenv_t floatingPoint = {};
    unsigned vectorControl = _mm_getcsr(); // which this platform's fesetenv leaves alone
};

ProcessState::ProcessState()
    : m_snapshot(std::make_unique<Snapshot>())
{
    for (const int number : kSignals) {
        const SignalHandler handler = std::signal(number, SIG_DFL);
        std::signal(number, handler);
        m_snapshot->signalHandlers[number] = handler;
    }
    std::fegetenv(&m_snapshot->floatingPoint);
}

ProcessState::~ProcessState() = default;

void ProcessState::restore() const
{
    SetErrorMode(m_snapshot->errorMode);
    SetThreadErrorMode(m_snapshot->threadErrorMode, nullptr);
    SetUnhandledExceptionFilter(m_snapshot->unhandled);
    _set_invalid_parameter_handler(m_snapshot->invalidParameter);
    _set_error_mode(m_snapshot->crtErrorMode);
    for (const auto &[number, handler] : m_snapshot->signalHandlers)
        std::signal(number, handler);
    _configthreadlocale(_DISABLE_PER_THREAD_LOCALE);
    if (m_snapshot->locale != std::setlocale(LC_ALL, nullptr))
        std::setlocale(LC_ALL, m_snapshot->locale.c_str());
    SetThreadLocale(m_snapshot->threadLocale);
    std::fesetenv(&m_snapshot->floatingPoint);
    _mm_setcsr(m_snapshot->vectorControl);
    SetDllDirectoryW(m_snapshot->libraries.empty() ? nullptr : m_snapshot->libraries.c_str());
    if (!SetCurrentDirectoryW(m_snapshot->folder.c_str()))
        DebugLog(L"Cannot return to the working folder: %ls", systemMessage(GetLastError()));
    if (m_snapshot->apartment && !hasApartment())
        CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED);
}
