#pragma once

#include "Core/BaseLib/Process/FaultGuard.h"

#include <functional>
#include <string>

/// Faults to commit under a guard, and what came of them.
namespace FaultGuardTrials {

#ifdef _WIN32
inline constexpr char kOverflowOutcome[] = "SE Exception: 0xC00000FD";
#else
inline constexpr char kOverflowOutcome[] = "SE Exception: Access Violation";
#endif

// Faults are committed through volatile values, so that the compiler cannot see and remove them.
inline volatile int g_zero = 0;
inline volatile int g_seven = 7;
inline int *volatile g_nowhere = nullptr;

[[gnu::noinline]] inline int overflowStack(int depth)
{
    volatile char block[4096] = {};
    block[depth % 4096] = char(depth);
    return depth < 0 ? 0 : overflowStack(depth + 1) + block[0];
}

[[gnu::no_sanitize("all")]] inline void writeNowhere() { *g_nowhere = 1; }

/// What came of a guarded call.
inline std::string outcome(const std::function<void()> &function)
{
    try {
        callGuarded([&] { function(); });
    } catch (const SEException &fault) {
        return fault.what();
    } catch (const ForeignException &exception) {
        return std::string("foreign ") + exception.what();
    } catch (const std::exception &exception) {
        return std::string("exception ") + exception.what();
    } catch (int number) {
        return "int " + std::to_string(number);
    }
    return "returned";
}

} // namespace FaultGuardTrials
