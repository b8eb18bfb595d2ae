#include "Core/BaseLib/Process/StandardInput.h"

#include <qt_windows.h>

#include <algorithm>
#include <array>

QByteArray StandardInput::takeArrived()
{
    HANDLE input = GetStdHandle(STD_INPUT_HANDLE);
    DWORD waiting = 0;
    if (!PeekNamedPipe(input, nullptr, 0, nullptr, &waiting, nullptr) || waiting == 0)
        return QByteArray();
    std::array<char, kMostArrived> arrived;
    DWORD size = 0;
    const BOOL isRead =
        ReadFile(input, arrived.data(), std::min<DWORD>(waiting, arrived.size()), &size, nullptr);
    return isRead ? QByteArray(arrived.data(), static_cast<int>(size)) : QByteArray();
}
