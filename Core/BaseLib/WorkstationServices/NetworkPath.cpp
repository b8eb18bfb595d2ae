#include "Core/BaseLib/WorkstationServices/NetworkPath.h"

#include "Core/BaseLib/Log/DebugLog.h"

#include <algorithm>
#include <vector>

namespace {

constexpr QLatin1Char kSeparator('\\');

struct MappedDrive {
    QString device;
    QString remoteName;
};

/// The drives that are connected to the network, in the system's order.
std::vector<MappedDrive> mappedDrives(NetworkDrives &drives)
{
    const NetworkDrives::List list = drives.list();
    if (!list.isKnown)
        DebugLog(L"Failed in GetLogicalDriveStrings.  Error %d", list.error);
    std::vector<MappedDrive> mapped;
    for (const QString &device : list.devices) {
        const std::optional<QString> remoteName = drives.remoteName(device);
        if (remoteName && !remoteName->isEmpty() && remoteName->size() < kNetworkPathBuffer)
            mapped.push_back({device, *remoteName});
    }
    return mapped;
}

/// The first part of a network path; empty when it has none.
QString serverOf(const QString &path) { return path.section(kSeparator, 0, 0, QString::SectionSkipEmpty); }

bool areOnOneServer(const QString &path, const QString &remoteName)
{
    const QString server = serverOf(path);
    return !server.isEmpty() && server.compare(serverOf(remoteName), Qt::CaseInsensitive) == 0;
}

/// What follows the drive in an administrative share ("\\server\D$\folder") or a path with a drive in it;
/// none for other paths.
std::optional<QString> behindItsDrive(const QString &path)
{
    const int dollar = path.indexOf(QLatin1Char('$'));
    const int end = dollar >= 0 ? dollar : path.indexOf(QLatin1Char(':'));
    return end >= 0 ? std::make_optional(path.mid(end + 1)) : std::nullopt;
}

/// The path through the drive's server; empty when nothing exists there.
QString viaServer(const QString &path, const MappedDrive &drive, NetworkDrives &drives)
{
    const std::optional<QString> rest =
        areOnOneServer(path, drive.remoteName) ? behindItsDrive(path) : std::nullopt;
    const QString candidate = rest ? drive.device + *rest : QString();
    return rest && drives.exists(candidate) ? candidate : QString();
}

/// False when the text and its terminating zero do not fit the buffer: a cut path would lead to another file.
bool copyTo(wchar_t (&buffer)[kNetworkPathBuffer], const QString &text)
{
    const std::wstring wide = text.toStdWString();
    if (wide.size() >= kNetworkPathBuffer)
        return false;
    std::copy_n(wide.c_str(), wide.size() + 1, buffer);
    return true;
}

} // namespace

bool mapToDrive(const std::wstring &uncPath, wchar_t (&drivePath)[kNetworkPathBuffer], NetworkDrives &drives)
{
    const QString path = QString::fromStdWString(uncPath);
    for (const MappedDrive &drive : mappedDrives(drives)) {
        if (path.startsWith(drive.remoteName, Qt::CaseInsensitive)) {
            const QString rest = path.mid(drive.remoteName.size());
            const QString result = drive.device + rest;
            // A longer name with the same beginning ends the search: later drives are not tried.
            if (!rest.startsWith(kSeparator) || !copyTo(drivePath, result))
                return false;
            DebugLog(L"%s  >>> %s", path, result);
            return true;
        }
        const QString result = viaServer(path, drive, drives);
        if (!result.isEmpty() && copyTo(drivePath, result)) {
            DebugLog(L"Found via server name match '%s'  >>> '%s'", path, result);
            return true;
        }
    }
    return false;
}

bool isOnMappedServer(const std::wstring &uncPath, NetworkDrives &drives)
{
    const QString path = QString::fromStdWString(uncPath);
    const std::vector<MappedDrive> mapped = mappedDrives(drives);
    return std::any_of(mapped.begin(), mapped.end(),
                       [&](const MappedDrive &drive) { return areOnOneServer(path, drive.remoteName); });
}
