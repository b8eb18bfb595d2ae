#include "Core/BaseLib/WorkstationServices/NetworkDrives.h"

#include <cwchar>

#include <windows.h>

#include <winnetwk.h>

namespace {

class WindowsDrives : public NetworkDrives {
public:
    List list() override
    {
        wchar_t roots[MAX_PATH] = {}; // "C:\", zero, "D:\", zero, zero
        const DWORD room = MAX_PATH - 1;
        const DWORD length = GetLogicalDriveStringsW(room, roots);
        if (length == 0 || length > room)
            return {false, static_cast<int>(GetLastError()), {}};
        List drives{true, 0, {}};
        for (const wchar_t *root = roots; *root; root += std::wcslen(root) + 1)
            drives.devices.append(QChar(root[0]) + QStringLiteral(":"));
        return drives;
    }

    std::optional<QString> remoteName(const QString &device) override
    {
        wchar_t name[MAX_PATH] = {};
        DWORD length = MAX_PATH;
        if (WNetGetConnectionW(device.toStdWString().c_str(), name, &length) != NO_ERROR)
            return std::nullopt;
        return QString::fromWCharArray(name);
    }

    bool exists(const QString &path) override
    {
        return GetFileAttributesW(path.toStdWString().c_str()) != INVALID_FILE_ATTRIBUTES;
    }
};

} // namespace

NetworkDrives &NetworkDrives::system()
{
    static WindowsDrives drives;
    return drives;
}
