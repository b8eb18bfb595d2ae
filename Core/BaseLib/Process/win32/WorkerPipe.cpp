#include "Core/BaseLib/Process/win32/WorkerPipe.h"

#include <atomic>
#include <utility>

namespace {

constexpr int kBlock = 65536;

/// A name that no other pipe of this machine has.
QString newPipeName()
{
    static std::atomic<unsigned> last{0};
    return QStringLiteral(R"(\\.\pipe\FxProbe.%1.%2)").arg(GetCurrentProcessId()).arg(++last);
}

HANDLE newEvent() { return CreateEventW(nullptr, TRUE, FALSE, nullptr); }

} // namespace

WorkerPipe::WorkerPipe(Direction direction, HANDLE port)
    : m_direction(direction)
    , m_name(newPipeName())
    , m_pipe(CreateNamedPipeW(qUtf16Printable(m_name),
                              (direction == Direction::Both ? PIPE_ACCESS_DUPLEX : PIPE_ACCESS_INBOUND) |
                                  FILE_FLAG_OVERLAPPED | FILE_FLAG_FIRST_PIPE_INSTANCE,
                              PIPE_TYPE_BYTE | PIPE_READMODE_BYTE | PIPE_WAIT | PIPE_REJECT_REMOTE_CLIENTS, 1,
                              kBlock, kBlock, 0, nullptr))
    , m_hasRead(newEvent())
    , m_hasWritten(newEvent())
    , m_block(kBlock, Qt::Uninitialized)
{
    if (isOpen() && !CreateIoCompletionPort(m_pipe, port, 0, 0))
        close();
}

WorkerPipe::~WorkerPipe() { close(); }

HANDLE WorkerPipe::openOtherEnd() const
{
    SECURITY_ATTRIBUTES inheritable = {sizeof inheritable, nullptr, TRUE};
    const DWORD access =
        GENERIC_WRITE | (m_direction == Direction::Both ? GENERIC_READ : FILE_READ_ATTRIBUTES);
    return CreateFileW(qUtf16Printable(m_name), access, 0, &inheritable, OPEN_EXISTING, 0, nullptr);
}

void WorkerPipe::startReading()
{
    m_reading = {};
    m_reading.hEvent = m_hasRead.get();
    m_isReading = ReadFile(m_pipe, m_block.data(), static_cast<DWORD>(m_block.size()), nullptr, &m_reading) ||
                  GetLastError() == ERROR_IO_PENDING;
    if (!m_isReading)
        close();
}

QByteArray WorkerPipe::take()
{
    continueWriting();
    DWORD count = 0;
    if (!isOpen() || !HasOverlappedIoCompleted(&m_reading))
        return QByteArray();
    m_isReading = false;
    if (!GetOverlappedResult(m_pipe, &m_reading, &count, FALSE)) {
        close();
        return QByteArray();
    }
    const QByteArray taken(m_block.constData(), static_cast<int>(count));
    startReading();
    return taken;
}

void WorkerPipe::send(const QByteArray &bytes)
{
    m_unsent += bytes;
    continueWriting();
}

void WorkerPipe::continueWriting()
{
    if (m_isWriting && HasOverlappedIoCompleted(&m_writing))
        m_isWriting = false; // as a whole, or never: a broken pipe is seen by reading
    if (!isOpen() || m_isWriting || m_unsent.isEmpty())
        return;
    m_written = std::exchange(m_unsent, QByteArray());
    m_writing = {};
    m_writing.hEvent = m_hasWritten.get();
    m_isWriting =
        WriteFile(m_pipe, m_written.constData(), static_cast<DWORD>(m_written.size()), nullptr, &m_writing) ||
        GetLastError() == ERROR_IO_PENDING;
}

void WorkerPipe::close()
{
    if (!isOpen())
        return;
    CancelIoEx(m_pipe, nullptr);
    // The system writes into these buffers until it says that it has ended.
    DWORD count = 0;
    if (m_isReading)
        GetOverlappedResult(m_pipe, &m_reading, &count, TRUE);
    if (m_isWriting)
        GetOverlappedResult(m_pipe, &m_writing, &count, TRUE);
    CloseHandle(std::exchange(m_pipe, INVALID_HANDLE_VALUE));
    m_isReading = m_isWriting = false;
}
