#pragma once

#include <memory>

/// What a plug-in may change for the whole process and later code relies on: signal handlers and mask, a
/// pending alarm, locale (C and C++), file creation mask, working directory and the calling thread's
/// floating-point environment; on Windows also the error modes, the filter for unhandled exceptions, the
/// folder in which libraries are searched, and the thread's COM apartment. Taken once, put back after each
/// plug-in, on the same thread.
class ProcessState {
public:
    ProcessState();
    ~ProcessState();
    ProcessState(const ProcessState &) = delete;
    ProcessState &operator=(const ProcessState &) = delete;

    /// Puts back what differs from the state taken.
    void restore() const;

private:
    struct Snapshot;
    std::unique_ptr<Snapshot> m_snapshot;
};
