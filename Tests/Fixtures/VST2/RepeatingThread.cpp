#include "Tests/Fixtures/VST2/RepeatingThread.h"

#include "Tests/Fixtures/FixturePlatform.h"

#include <utility>

RepeatingThread::RepeatingThread(std::function<void()> step)
    : m_thread([stopping = m_stopping, step = std::move(step)] {
        while (!*stopping) {
            step();
            sleepMilliseconds(1);
        }
    })
{}

RepeatingThread::~RepeatingThread()
{
    if (m_thread.joinable())
        m_thread.detach();
}

void RepeatingThread::stop()
{
    *m_stopping = true;
    if (m_thread.joinable())
        m_thread.join();
}
