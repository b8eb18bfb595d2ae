#include "Core/BaseLib/Binary/PluginLibrary.h"

#include "Core/BaseLib/Binary/win32/ImportSearch.h"
#include "Core/BaseLib/Files/NativeFile.h"
#include "Core/BaseLib/Files/win32/WindowsText.h"

#include <QDir>
#include <QFileInfo>
#include <QScopeGuard>

#include <algorithm>
#include <iterator>

#include <windows.h>

#include <psapi.h>

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
                 notLoaded(systemMessage(error, QStringLiteral("the file"))));
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

bool PluginLibrary::isMapped(const QString &path)
{
    HMODULE modules[1024]; // more than any process of ours has
    DWORD size = 0;
    if (!K32EnumProcessModules(GetCurrentProcess(), modules, sizeof modules, &size))
        return false;
    const DWORD count = std::min<DWORD>(size, sizeof modules) / sizeof(HMODULE);
    return std::any_of(modules, modules + count, [&](HMODULE module) {
        wchar_t name[32768]; // longest path (NTFS)
        const DWORD length = GetModuleFileNameW(module, name, DWORD(std::size(name)));
        const QString file =
            QDir::fromNativeSeparators(QString::fromWCharArray(name, static_cast<int>(length)));
        return isSamePath(file, path) || isBelow(file, path);
    });
}

bool PluginLibrary::hasNeededLibraries(const QString &path)
{
    return whyNotLoadable(path, importSearch(QFileInfo(path).path())).isEmpty();
}

ModuleInspection PluginLibrary::inspect(const QString &path, const std::vector<QByteArray> &exports)
{
    return inspectModule(path, exports);
}

QString PluginLibrary::fileEnding() { return QStringLiteral(".dll"); }
