#pragma once

#include <atomic>
#include <chrono>
#include <functional>
#include <thread>

/// The system's request that the process end: a termination signal, or the end of the user's session.
namespace TerminationSignal {

/// A process that starts this one puts its own process identifier into this environment variable; its end
/// counts as a request. A job object of Windows would end this process in the middle of its work instead, and
/// with it whatever plug-ins have started.
inline constexpr char kParentVariable[] = "FXPROBE_PARENT";

/// From now on the system's request no longer kills the process but is waited for.
void install();
/// Makes the request by hand. Safe in a signal handler.
void raise();
/// True when a request came within the time given; each request is reported once.
bool wait(std::chrono::milliseconds timeout);

} // namespace TerminationSignal

/// Waits for a termination request on a thread of its own.
class TerminationWatcher {
public:
    /// `requested` is called once, when a request comes. When the watcher still lives `grace` later,
    /// `overdue` is called, and then again every tenth of a second: who asked will not wait for ever.
    /// Both run on the watcher's thread.
    TerminationWatcher(std::function<void()> requested, std::function<void()> overdue,
                       std::chrono::milliseconds grace);
    /// Stops watching; waits for a running call to return.
    ~TerminationWatcher();
    TerminationWatcher(const TerminationWatcher &) = delete;
    TerminationWatcher &operator=(const TerminationWatcher &) = delete;

private:
    void watch();
    bool sleepUnlessStopped(std::chrono::milliseconds time);

    std::function<void()> m_requested;
    std::function<void()> m_overdue;
    std::chrono::milliseconds m_grace;
    std::atomic<bool> m_stop{false};
    bool m_sawWakeUp = false; ///< the thread's, until it has ended
    std::thread m_thread;
};
