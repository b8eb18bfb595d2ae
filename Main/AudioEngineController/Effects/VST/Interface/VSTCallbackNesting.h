#pragma once

#include <QScopeGuard>

#include <cstdint>

/// Counts the calls of the host callback that are active on this thread.
namespace VSTCallbackNesting {

/// Most active calls on one thread that are answered.
inline constexpr std::int32_t kMaxActive = 10;
/// From here on the counter is taken to have run away, and is set back instead of refusing calls for ever.
inline constexpr std::int32_t kRunaway = 4096;

/// The number of active calls on this thread.
std::int32_t active();
void setActive(std::int32_t count);
/// Counts a call that begins; false, with a log line, when it must be refused. Either way it ends with
/// `leave`.
bool enter();
void leave();

/// Puts the counter back at scope exit: a fault skips the `leave` of the calls that it ends.
[[nodiscard]] inline auto keep()
{
    return qScopeGuard([before = active()] { setActive(before); });
}

} // namespace VSTCallbackNesting
