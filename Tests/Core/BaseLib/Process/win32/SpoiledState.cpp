#include "Tests/Core/BaseLib/Process/SpoiledState.h"

#include <QDir>

#include <cfenv>
#include <clocale>
#include <csignal>
#include <sstream>

#include <windows.h>

#include <objbase.h>
#include <xmmintrin.h>

namespace {

LONG WINAPI endAtOnce(EXCEPTION_POINTERS *) { return EXCEPTION_EXECUTE_HANDLER; }
void ignoreParameter(const wchar_t *, const wchar_t *, const wchar_t *, unsigned, uintptr_t) {}

} // namespace

void prepareState()
{
    std::setlocale(LC_ALL, "English_United States.1252");
    CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED);
}

std::string wholeState()
{
    std::ostringstream state;
    state << std::setlocale(LC_ALL, nullptr) << ' ' << GetThreadLocale();
    state << "\nfolder " << QDir::currentPath().toStdString();
    wchar_t folder[MAX_PATH] = {};
    GetDllDirectoryW(MAX_PATH, folder);
    state << "\nlibraries " << QString::fromWCharArray(folder).toStdString();
    state << "\nfloating point " << std::fegetround() << ' ' << (_mm_getcsr() & _MM_FLUSH_ZERO_MASK);
    const auto handler = std::signal(SIGSEGV, SIG_DFL);
    std::signal(SIGSEGV, handler);
    const auto filter = SetUnhandledExceptionFilter(nullptr);
    SetUnhandledExceptionFilter(filter);
    const auto parameter = _set_invalid_parameter_handler(nullptr);
    _set_invalid_parameter_handler(parameter);
    state << "\nhandlers " << reinterpret_cast<void *>(handler) << ' ' << reinterpret_cast<void *>(filter)
          << ' ' << reinterpret_cast<void *>(parameter);
    APTTYPE apartment = {};
    APTTYPEQUALIFIER qualifier = {};
    state << "\nboxes " << GetErrorMode() << ' ' << GetThreadErrorMode() << ' '
          << _set_error_mode(_REPORT_ERRMODE) << " apartment " << CoGetApartmentType(&apartment, &qualifier)
          << ' ' << apartment;
    return state.str();
}

std::vector<Spoiling> spoilings()
{
    return {
        {"C locale", [] { std::setlocale(LC_ALL, "C"); }},
        {"the thread's own locale",
         [] {
             _configthreadlocale(_ENABLE_PER_THREAD_LOCALE);
             std::setlocale(LC_ALL, "C");
         }},
        {"the thread's language", [] { SetThreadLocale(MAKELCID(LANG_GERMAN, SORT_DEFAULT)); }},
        {"working folder", [] { QDir::setCurrent(QDir::rootPath()); }},
        {"folder for libraries", [] { SetDllDirectoryW(L"C:\\Elsewhere"); }},
        {"rounding mode", [] { std::fesetround(FE_UPWARD); }},
        {"denormals flushed to zero", [] { _MM_SET_FLUSH_ZERO_MODE(_MM_FLUSH_ZERO_ON); }},
        {"handler of a fault", [] { std::signal(SIGSEGV, [](int) {}); }},
        {"filter for unhandled exceptions", [] { SetUnhandledExceptionFilter(endAtOnce); }},
        {"handler of invalid parameters", [] { _set_invalid_parameter_handler(ignoreParameter); }},
        {"boxes of the system", [] { SetErrorMode(SEM_NOOPENFILEERRORBOX); }},
        {"boxes of the system on the thread", [] { SetThreadErrorMode(SEM_NOOPENFILEERRORBOX, nullptr); }},
        {"boxes of the run-time library", [] { _set_error_mode(_OUT_TO_MSGBOX); }},
        {"COM apartment", [] { CoUninitialize(); }},
    };
}
