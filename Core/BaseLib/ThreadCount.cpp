#include "Core/BaseLib/ThreadCount.h"

#include <thread>

bool threadsSettleTo(int allowed, std::chrono::milliseconds patience)
{
    const auto deadline = std::chrono::steady_clock::now() + patience;
    while (runningThreads() > allowed) {
        if (std::chrono::steady_clock::now() >= deadline)
            return false;
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
    return true;
}
