#pragma once

#include "Core/BaseLib/WorkstationServices/NetworkDrives.h"

#include <string>

/// Characters of a Windows path with its terminating zero (MAX_PATH).
inline constexpr int kNetworkPathBuffer = 260;

/// Turns a network path ("\\server\share\...") into the same path through a drive letter that the user has
/// mapped on this machine. False when there is none, or when that path does not fit into the buffer, which is
/// left alone then.
bool mapToDrive(const std::wstring &uncPath, wchar_t (&drivePath)[kNetworkPathBuffer],
                NetworkDrives &drives = NetworkDrives::system());

/// Whether any drive of this machine is mapped to the server of a network path.
bool isOnMappedServer(const std::wstring &uncPath, NetworkDrives &drives = NetworkDrives::system());
