#include "Core/BaseLib/Binary/PluginLibrary.h"

#include "Core/BaseLib/Binary/win32/ImportSearch.h"
#include "Core/BaseLib/Files/win32/WindowsText.h"

#include <QFileInfo>
#include <QScopeGuard>

void *PluginLibrary::loadUncached(const QString &path) noexcept
{
    if (path.isEmpty()) {
        m_errorText = QStringLiteral("no path given");
        return nullptr;
    }
    // So that a damaged file or a missing library opens no system box.
    const DWORD errorMode = GetThreadErrorMode();
    SetThreadErrorMode(errorMode | SEM_FAILCRITICALERRORS, nullptr);
    const auto restore = qScopeGuard([errorMode] { SetThreadErrorMode(errorMode, nullptr); });
    const std::wstring native = nativePath(path);
    HMODULE module = nullptr;
    if (searchDllLoadDir)
        module = LoadLibraryExW(native.c_str(), nullptr, LOAD_LIBRARY_SEARCH_DLL_LOAD_DIR);
    if (!module)
        module = LoadLibraryW(native.c_str());
    if (module)
        return module;
    const DWORD error = GetLastError();
    setErrorText(path, importSearch(searchDllLoadDir ? QFileInfo(path).path() : QString()),
                 systemMessage(error, QStringLiteral("the file")));
    return nullptr;
}

void *PluginLibrary::symbol(const char *name) const
{
    if (!m_handle)
        return nullptr;
    return reinterpret_cast<void *>(GetProcAddress(static_cast<HMODULE>(m_handle), name));
}

void PluginLibrary::free()
{
    if (useProcessCache || !m_handle)
        return;
    FreeLibrary(static_cast<HMODULE>(m_handle));
    m_handle = nullptr;
}

QString PluginLibrary::fileEnding() { return QStringLiteral(".dll"); }
