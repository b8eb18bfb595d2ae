#pragma once

#include "Core/BaseLib/Files/win32/WindowsHandle.h"

#include <QByteArray>
#include <QString>

/// Our end of a pipe to another process. The system reads and writes while this process does something else:
/// nothing here waits for the other end, whatever it does.
class WorkerPipe {
public:
    enum class Direction { Both, FromWorker };

    /// `port` receives a packet whenever there is something to take.
    WorkerPipe(Direction direction, HANDLE port);
    ~WorkerPipe();
    WorkerPipe(const WorkerPipe &) = delete;
    WorkerPipe &operator=(const WorkerPipe &) = delete;

    /// Opens the other end, which a new process inherits.
    HANDLE openOtherEnd() const;
    /// Begins to read; to be called when the other end is open.
    void begin() { startReading(); }
    /// Whether the other end may still send something.
    bool isOpen() const { return m_pipe != INVALID_HANDLE_VALUE; }
    /// What came since the last call, at most one block; closes the pipe when the other end is gone.
    QByteArray take();
    void send(const QByteArray &bytes);
    void close();

private:
    void startReading();
    void continueWriting();

    const Direction m_direction;
    QString m_name;
    HANDLE m_pipe;
    WindowsHandle m_hasRead;
    WindowsHandle m_hasWritten;
    OVERLAPPED m_reading = {};
    OVERLAPPED m_writing = {};
    bool m_isReading = false;
    bool m_isWriting = false;
    QByteArray m_block;   ///< being read
    QByteArray m_written; ///< being written
    QByteArray m_unsent;
};
