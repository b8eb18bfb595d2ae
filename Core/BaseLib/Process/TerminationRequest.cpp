#include "Core/BaseLib/Process/TerminationRequest.h"

#include <algorithm>
#include <utility>

namespace {
constexpr std::chrono::milliseconds kStep(50);
constexpr std::chrono::milliseconds kReminder(100);
} // namespace

TerminationWatcher::TerminationWatcher(std::function<void()> requested, std::function<void()> overdue,
                                       std::chrono::milliseconds grace)
    : m_requested(std::move(requested))
    , m_overdue(std::move(overdue))
    , m_grace(grace)
{
    TerminationSignal::install();
    m_thread = std::thread([this] { watch(); });
}

TerminationWatcher::~TerminationWatcher()
{
    m_stop = true;
    TerminationSignal::raise(); // wakes the thread
    m_thread.join();
    if (!m_sawWakeUp)
        TerminationSignal::wait(std::chrono::milliseconds(0)); // which another watcher would take for its own
}

void TerminationWatcher::watch()
{
    while (!TerminationSignal::wait(kStep))
        if (m_stop)
            return;
    m_sawWakeUp = m_stop;
    if (m_sawWakeUp)
        return;
    m_requested();
    for (auto patience = m_grace; sleepUnlessStopped(patience); patience = kReminder)
        m_overdue();
}

bool TerminationWatcher::sleepUnlessStopped(std::chrono::milliseconds time)
{
    const auto end = std::chrono::steady_clock::now() + time;
    while (!m_stop && std::chrono::steady_clock::now() < end)
        std::this_thread::sleep_for(std::min(kStep, time));
    return !m_stop;
}
