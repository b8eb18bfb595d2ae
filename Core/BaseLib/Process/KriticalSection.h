#pragma once

#include <mutex>

/// A critical section that its own thread may enter again.
class KriticalSection {
public:
    void enter() { m_mutex.lock(); }
    void leave() { m_mutex.unlock(); }

    /// Whether guards take the lock at all; set it before other threads know the section.
    void setUseLock(bool useLock) { m_useLock = useLock; }
    bool useLock() const { return m_useLock; }

private:
    std::recursive_mutex m_mutex;
    bool m_useLock = true;
};

/// Holds a critical section for the length of a scope.
class TAutoLockCS {
public:
    /// A null section is reported as an assertion and the scope runs unguarded.
    explicit TAutoLockCS(KriticalSection *section);
    ~TAutoLockCS();
    TAutoLockCS(const TAutoLockCS &) = delete;
    TAutoLockCS &operator=(const TAutoLockCS &) = delete;

private:
    KriticalSection *m_entered = nullptr;
};
