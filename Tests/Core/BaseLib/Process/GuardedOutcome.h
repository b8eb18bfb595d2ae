#pragma once

#include "Core/BaseLib/Process/FaultGuard.h"

#include <functional>
#include <string>

#ifdef _WIN32
inline constexpr char kOverflowOutcome[] = "SE Exception: 0xC00000FD";
#else
inline constexpr char kOverflowOutcome[] = "SE Exception: Access Violation";
#endif

inline int *volatile g_nowhere = nullptr; ///< volatile, so that the compiler cannot see and remove the fault

[[gnu::no_sanitize("all")]] inline void writeNowhere() { *g_nowhere = 1; }

/// Recurses with frames of `size` bytes and a little more.
template <int size = 4096>
[[gnu::noinline, gnu::no_sanitize("all")]] int overflowStack(int depth)
{
    volatile char block[size] = {};
    block[depth % size] = char(depth);
    return depth < 0 ? 0 : overflowStack<size>(depth + 1) + block[0];
}

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
