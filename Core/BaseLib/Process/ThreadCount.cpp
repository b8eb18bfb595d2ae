#include "Core/BaseLib/Process/ThreadCount.h"

#include <algorithm>
#include <thread>

bool newThreadsEnd(const std::set<int> &before, std::chrono::milliseconds patience)
{
    const auto deadline = std::chrono::steady_clock::now() + patience;
    while (true) {
        const std::set<int> now = runningThreads();
        if (std::includes(before.begin(), before.end(), now.begin(), now.end()))
            return true;
        if (std::chrono::steady_clock::now() >= deadline)
            return false;
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
}
