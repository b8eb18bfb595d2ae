#pragma once

#include <atomic>
#include <functional>
#include <memory>
#include <thread>

/// A thread of the plug-in's own that does the same again and again until it is stopped. One that was not
/// stopped outlives this object, as in a plug-in that nobody closed: it dies when the module is unmapped
/// under it.
class RepeatingThread {
public:
    explicit RepeatingThread(std::function<void()> step);
    ~RepeatingThread();
    RepeatingThread(const RepeatingThread &) = delete;
    RepeatingThread &operator=(const RepeatingThread &) = delete;

    void stop();

private:
    std::shared_ptr<std::atomic<bool>> m_stopping = std::make_shared<std::atomic<bool>>(false);
    std::thread m_thread;
};
