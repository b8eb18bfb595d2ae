#pragma once

#include <functional>

/// Calls back on the application's thread when the connection to the screen breaks, before Qt ends the
/// process for it. One object at a time; the callback may leave the process itself.
class ScreenLoss {
public:
    explicit ScreenLoss(std::function<void()> lost);
    ~ScreenLoss();
    ScreenLoss(const ScreenLoss &) = delete;
    ScreenLoss &operator=(const ScreenLoss &) = delete;
};
