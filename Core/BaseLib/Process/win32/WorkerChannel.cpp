#include "Core/BaseLib/Process/WorkerGroup.h"

#include <cstdlib>
#include <iterator>

#include <windows.h>

namespace {

constexpr int kBlock = 65536;

/// What the scanner handed to this process; null in a process that is not a worker.
HANDLE givenChannel()
{
    char text[32] = {};
    const DWORD length =
        GetEnvironmentVariableA(WorkerChannel::kVariable, text, static_cast<DWORD>(std::size(text)));
    if (length == 0 || length >= std::size(text))
        return nullptr;
    auto *const handle = reinterpret_cast<HANDLE>(std::strtoull(text, nullptr, 10));
    return GetFileType(handle) == FILE_TYPE_PIPE ? handle : nullptr;
}

} // namespace

bool WorkerChannel::isThere() { return givenChannel() != nullptr; }

WorkerChannel::WorkerChannel()
    : m_handle(reinterpret_cast<qintptr>(givenChannel()))
{
    // Not for what plug-ins start; and some close every handle that they find.
    SetHandleInformation(reinterpret_cast<HANDLE>(m_handle),
                         HANDLE_FLAG_INHERIT | HANDLE_FLAG_PROTECT_FROM_CLOSE,
                         HANDLE_FLAG_PROTECT_FROM_CLOSE);
    SetEnvironmentVariableA(kVariable, nullptr);
}

WorkerChannel::~WorkerChannel()
{
    SetHandleInformation(reinterpret_cast<HANDLE>(m_handle), HANDLE_FLAG_PROTECT_FROM_CLOSE, 0);
    CloseHandle(reinterpret_cast<HANDLE>(m_handle));
}

QByteArray WorkerChannel::read()
{
    QByteArray bytes(kBlock, Qt::Uninitialized);
    DWORD count = 0;
    if (!ReadFile(reinterpret_cast<HANDLE>(m_handle), bytes.data(), static_cast<DWORD>(bytes.size()), &count,
                  nullptr))
        count = 0;
    return bytes.left(static_cast<int>(count));
}

bool WorkerChannel::write(const QByteArray &bytes)
{
    int done = 0;
    while (done < bytes.size()) {
        DWORD count = 0;
        if (!WriteFile(reinterpret_cast<HANDLE>(m_handle), bytes.constData() + done,
                       static_cast<DWORD>(bytes.size() - done), &count, nullptr))
            return false;
        done += static_cast<int>(count);
    }
    return true;
}
