#include "Core/BaseLib/Process/StandardInput.h"

#include <array>

#include <poll.h>
#include <unistd.h>

QByteArray StandardInput::takeArrived()
{
    pollfd input = {STDIN_FILENO, POLLIN, 0};
    if (poll(&input, 1, 0) <= 0 || (input.revents & POLLIN) == 0)
        return QByteArray();
    std::array<char, kMostArrived> arrived;
    const ssize_t size = read(STDIN_FILENO, arrived.data(), arrived.size());
    return size > 0 ? QByteArray(arrived.data(), static_cast<int>(size)) : QByteArray();
}
