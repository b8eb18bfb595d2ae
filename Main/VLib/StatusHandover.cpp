#include "Main/VLib/StatusHandover.h"

#include <utility>

void StatusHandover::setText(const QString &text)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_pending.text = text;
}

void StatusHandover::setValue(int value)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_pending.value = value;
}

void StatusHandover::setRange(int minimum, int maximum)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_pending.minimum = minimum;
    m_pending.maximum = maximum;
}

void StatusHandover::setRange(int minimum, int maximum, const QString &text)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_pending.minimum = minimum;
    m_pending.maximum = maximum;
    m_pending.text = text;
}

PendingStatus StatusHandover::take()
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    return std::exchange(m_pending, PendingStatus());
}

void StatusHandover::requestShow()
{
    if (!m_shown.exchange(true))
        m_showPending = true;
}
