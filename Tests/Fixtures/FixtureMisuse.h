#pragma once

#include <string>

/// The exit code of a process whose fixture was scripted wrongly or called against its rules, so that neither
/// passes for one of the faults that a test asked for.
inline constexpr int kFixtureMisused = 86;

/// Ends the process with kFixtureMisused and says why on the error output.
[[noreturn]] void reportMisuse(const std::string &reason);
