#include "Core/BaseLib/Files/NativeFile.h"

#include "Core/BaseLib/Files/win32/WindowsHandle.h"
#include "Core/BaseLib/Files/win32/WindowsText.h"
#include "Core/BaseLib/Log/FormatText.h"

#include <QDateTime>
#include <QDir>
#include <QFileInfo>
#include <QRegularExpression>

#include <limits>
#include <tuple>
#include <vector>

#include <io.h>

namespace {

/// How long others may hold a file that is to be replaced or deleted: readers, indexers and virus scanners
/// hold it for moments.
constexpr DWORD kPatience = 1000; ///< ms
constexpr DWORD kPause = 10;      ///< ms

/// Between 1601, where the system's times start, and 1970, in units of 100 ns.
constexpr qint64 kEpoch = 116444736000000000;
constexpr qint64 kNanosecondsPerUnit = 100;

/// Opens a file or a folder to ask for what the system keeps of it.
WindowsHandle openForAttributes(const QString &path)
{
    return WindowsHandle(CreateFileW(nativePath(path).c_str(), FILE_READ_ATTRIBUTES,
                                     FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE, nullptr,
                                     OPEN_EXISTING, FILE_FLAG_BACKUP_SEMANTICS, nullptr)); // for folders too
}

bool isHeldByOthers(DWORD error) { return error == ERROR_SHARING_VIOLATION || error == ERROR_ACCESS_DENIED; }

bool isGone(DWORD error) { return error == ERROR_FILE_NOT_FOUND || error == ERROR_PATH_NOT_FOUND; }

/// Tries again for a while what fails only because others hold the file. `operation` leaves the reason with
/// the system.
template <typename Operation>
FileResult patiently(const QString &path, Operation &&operation)
{
    for (DWORD waited = 0;; waited += kPause) {
        if (operation())
            return {};
        const DWORD error = GetLastError();
        if (!isHeldByOthers(error) || waited >= kPatience)
            return {systemMessage(error, path)};
        Sleep(kPause);
    }
}

/// Volume and number of a file, the same by whatever path it is reached.
using FileIdentity = std::tuple<DWORD, DWORD, DWORD>;

std::optional<FileIdentity> identityOf(const WindowsHandle &file)
{
    BY_HANDLE_FILE_INFORMATION information = {};
    if (!file.isValid() || !GetFileInformationByHandle(file.get(), &information))
        return std::nullopt;
    return FileIdentity(information.dwVolumeSerialNumber, information.nFileIndexHigh,
                        information.nFileIndexLow);
}

/// Where an open file lies; empty when the system does not tell.
QString finalPath(const WindowsHandle &file)
{
    std::vector<wchar_t> text(MAX_PATH);
    DWORD length = 0;
    while ((length = GetFinalPathNameByHandleW(file.get(), text.data(), static_cast<DWORD>(text.size()), 0)) >
           text.size())
        text.resize(length);
    QString path = QDir::fromNativeSeparators(QString::fromWCharArray(text.data(), static_cast<int>(length)));
    if (path.startsWith(QLatin1String("//?/UNC/")))
        path.remove(2, 6);
    else if (path.startsWith(QLatin1String("//?/")))
        path.remove(0, 4);
    if (path.endsWith(QLatin1Char('/')))
        path.chop(1);
    return path;
}

qint64 unitsOf(const FILETIME &time)
{
    return static_cast<qint64>(quint64(time.dwHighDateTime) << 32 | time.dwLowDateTime);
}

} // namespace

FileResult renameOver(const QString &from, const QString &to)
{
    const std::wstring source = nativePath(from);
    const std::wstring target = nativePath(to);
    return patiently(to,
                     [&] { return MoveFileExW(source.c_str(), target.c_str(), MOVEFILE_REPLACE_EXISTING); });
}

FileResult removeFile(const QString &path)
{
    const std::wstring file = nativePath(path);
    return patiently(path, [&] { return DeleteFileW(file.c_str()) || isGone(GetLastError()); });
}

bool cannotBeExamined(const QString &path)
{
    return GetFileAttributesW(nativePath(path).c_str()) == INVALID_FILE_ATTRIBUTES && !isGone(GetLastError());
}

bool leadsNowhere(const QString &path)
{
    const QFileInfo file(path);
    return file.isSymLink() && !file.exists();
}

bool isDeviceName(const QString &name)
{
    static const QRegularExpression devices(QStringLiteral("^(con|prn|aux|nul|com[0-9]|lpt[0-9]) *(\\.|$)"),
                                            QRegularExpression::CaseInsensitiveOption);
    return devices.match(name).hasMatch();
}

std::optional<QString> realPath(const QString &path)
{
    const WindowsHandle file = openForAttributes(path);
    const std::optional<FileIdentity> identity = identityOf(file);
    if (!identity)
        return std::nullopt;
    const QString real = finalPath(file);
    if (!real.isEmpty())
        return real;
    // Drivers of some drives tell no path.
    const auto &[volume, high, low] = *identity;
    return formatText(L"%08lx:%08lx%08lx", volume, high, low);
}

void syncToDisk(int fileDescriptor) { _commit(fileDescriptor); }

std::optional<FileStatus> fileStatus(const QString &path)
{
    const QFileInfo file(path);
    if (!file.exists())
        return std::nullopt;
    QDateTime modified = file.lastModified();
    // Qt takes the first second of 1970 for no time at all; files from package systems that keep no dates
    // carry it.
    if (!modified.isValid())
        modified = QDateTime::fromMSecsSinceEpoch(0);
    const QDate day = modified.date();
    const QTime time = modified.time();
    return FileStatus{file.isFile(), {day.year(), day.month(), day.day(), time.hour(), time.minute()}};
}

qint64 modifiedNanoseconds(const QString &path)
{
    const WindowsHandle file = openForAttributes(path);
    FILETIME modified = {};
    if (!file.isValid() || !GetFileTime(file.get(), nullptr, nullptr, &modified))
        return -1;
    // 64 bits of nanoseconds end in 2262, file systems later; a time beyond counts as the last one.
    constexpr qint64 kLast = std::numeric_limits<qint64>::max() / kNanosecondsPerUnit;
    return qBound(-kLast, unitsOf(modified) - kEpoch, kLast) * kNanosecondsPerUnit;
}
