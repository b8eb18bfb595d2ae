#include "Main/ReWire/ReWireSystem.h"

#include <QScopeGuard>

#include <vector>

#include <windows.h>

#include <shlobj.h>

namespace {

/// Sets what the system may show to the user until the result goes out of scope.
auto scopedErrorMode(UINT mode)
{
    return qScopeGuard([before = SetErrorMode(mode)] { SetErrorMode(before); });
}

class WindowsReWire : public ReWireSystem {
public:
    bool isRecentEnough() override;
    std::optional<std::string> commonFilesFolder() override;
    void *load(const std::string &path) override;
    void *function(void *library, const char *name) override;
    void free(void *library) override { FreeLibrary(static_cast<HMODULE>(library)); }
    std::optional<std::string> pathOf(void *library) override;
    std::optional<quint32> fileVersion(const std::string &path) override;
};

bool WindowsReWire::isRecentEnough()
{
    OSVERSIONINFOEXW required = {};
    required.dwOSVersionInfoSize = sizeof(required);
    required.dwMajorVersion = 5;
    required.dwMinorVersion = 1;
    required.wServicePackMajor = 0;
    constexpr DWORD kFields = VER_MAJORVERSION | VER_MINORVERSION | VER_SERVICEPACKMAJOR;
    DWORDLONG conditions = 0;
    for (const DWORD field : {VER_MAJORVERSION, VER_MINORVERSION, VER_SERVICEPACKMAJOR})
        conditions = VerSetConditionMask(conditions, field, VER_GREATER_EQUAL);
    return VerifyVersionInfoW(&required, kFields, conditions) != FALSE;
}

std::optional<std::string> WindowsReWire::commonFilesFolder()
{
    char folder[MAX_PATH] = {};
    if (!SHGetSpecialFolderPathA(nullptr, folder, CSIDL_PROGRAM_FILES_COMMON, FALSE))
        return std::nullopt;
    return folder;
}

void *WindowsReWire::load(const std::string &path)
{
    const auto silent = scopedErrorMode(SEM_FAILCRITICALERRORS);
    return LoadLibraryA(path.c_str());
}

void *WindowsReWire::function(void *library, const char *name)
{
    return reinterpret_cast<void *>(GetProcAddress(static_cast<HMODULE>(library), name));
}

std::optional<std::string> WindowsReWire::pathOf(void *library)
{
    char path[256] = {};
    const DWORD length = GetModuleFileNameA(static_cast<HMODULE>(library), path, sizeof(path));
    if (length == 0 || length >= sizeof(path)) // a path that was cut is not the file's
        return std::nullopt;
    return std::string(path, length);
}

std::optional<quint32> WindowsReWire::fileVersion(const std::string &path)
{
    const auto silent = scopedErrorMode(SEM_NOOPENFILEERRORBOX);
    DWORD ignored = 0;
    const DWORD size = GetFileVersionInfoSizeA(path.c_str(), &ignored);
    std::vector<char> resource(size);
    void *value = nullptr;
    UINT length = 0;
    if (size == 0 || !GetFileVersionInfoA(path.c_str(), 0, size, resource.data()) ||
        !VerQueryValueA(resource.data(), "\\", &value, &length) || length < sizeof(VS_FIXEDFILEINFO))
        return std::nullopt;
    return static_cast<const VS_FIXEDFILEINFO *>(value)->dwFileVersionMS;
}

} // namespace

std::unique_ptr<ReWireSystem> installedReWireSystem() { return std::make_unique<WindowsReWire>(); }
