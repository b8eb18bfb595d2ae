#pragma once

#include <string>

/// Commits a fault as a broken plug-in would; most do not return.
using FixtureFault = void (*)();
/// The fault of a kind; null where no such kind is known.
FixtureFault findFault(const std::string &kind);

/// A change of the process's state that plug-ins leave behind.
struct FixtureSideEffect {
    const char *kind;
    bool takesValue;
    bool (*cause)(const std::string &value); ///< false when the value does not suit
};
/// The side effect of a kind, or null.
const FixtureSideEffect *findSideEffect(const std::string &kind);
