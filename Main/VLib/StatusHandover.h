#pragma once

#include <QString>

#include <atomic>
#include <mutex>

/// What the scan posted and the window has not shown yet.
struct PendingStatus {
    QString text;    ///< empty: none
    int value = -1;  ///< -1: none
    int minimum = 0; ///< range of the bar; equal ends: none
    int maximum = 0;
};

/// The only thing that the scan and its window share. Each side may outlive the other, so both own it
/// together. All operations may come from any thread.
class StatusHandover {
public:
    void setText(const QString &text);
    void setValue(int value);
    void setRange(int minimum, int maximum);
    /// Range and text in one step: the window never shows one without the other.
    void setRange(int minimum, int maximum, const QString &text);
    /// Hands out what is pending; nothing is pending afterwards.
    PendingStatus take();

    /// Asks for the window to appear; only the first request counts.
    void requestShow();
    /// True once for a request.
    bool takeShowRequest() { return m_showPending.exchange(false); }

    /// The window goes, and the scan is asked to stop.
    void setClosing() { m_closing = true; }
    bool isClosing() const { return m_closing; }

    /// The scan is over.
    void setFinished() { m_finished = true; }
    bool isFinished() const { return m_finished; }

private:
    std::mutex m_mutex;
    PendingStatus m_pending;
    std::atomic<bool> m_shown{false};
    std::atomic<bool> m_showPending{false};
    std::atomic<bool> m_closing{false};
    std::atomic<bool> m_finished{false};
};
