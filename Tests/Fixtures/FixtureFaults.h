#pragma once

#include <string>

/// Commits a fault as a broken plug-in would; most do not return. False where there is no such kind.
bool commitFault(const std::string &kind);
/// Changes the process's state as plug-ins do; false where there is no such kind or the value does not suit.
bool causeSideEffect(const std::string &kind, const std::string &value);
