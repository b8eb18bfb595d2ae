#pragma once

#include <chrono>
#include <condition_variable>
#include <mutex>

/// An event that stays set, for every thread that waits, until it is reset. Starts out not set.
class ManualResetEvent {
public:
    void set();
    void reset();
    bool isSet() const;
    /// True when the event was set within the time given.
    bool waitFor(std::chrono::milliseconds timeout) const;

private:
    mutable std::mutex m_mutex;
    mutable std::condition_variable m_changed;
    bool m_set = false;
};
