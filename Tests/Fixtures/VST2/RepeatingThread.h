#pragma once

#include "Tests/Fixtures/FixturePlatform.h"

#include <atomic>
#include <functional>
#include <memory>
#include <thread>
#include <utility>

/// A thread of the plug-in's own that does the same again and again until it is stopped. One that was not
/// stopped outlives this object, as in a plug-in that nobody closed: it dies when the module is unmapped
/// under it.
class RepeatingThread {
public:
    explicit RepeatingThread(std::function<void()> step)
        : m_thread([stopping = m_stopping, step = std::move(step)] {
            while (!*stopping) {
                step();
                sleepMilliseconds(1);
            }
        })
    {}
    ~RepeatingThread()
    {
        if (m_thread.joinable())
            m_thread.detach();
    }
    RepeatingThread(const RepeatingThread &) = delete;
    RepeatingThread &operator=(const RepeatingThread &) = delete;

    void stop()
    {
        *m_stopping = true;
        if (m_thread.joinable())
            m_thread.join();
    }

private:
    std::shared_ptr<std::atomic<bool>> m_stopping = std::make_shared<std::atomic<bool>>(false);
    std::thread m_thread;
};
