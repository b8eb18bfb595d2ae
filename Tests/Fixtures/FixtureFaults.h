#pragma once

#include <string>

/// Whether a kind of fault is known.
bool isFault(const std::string &kind);
/// Commits a fault as a broken plug-in would; most kinds do not return.
void commitFault(const std::string &kind);

/// Whether a kind of side effect is known.
bool isSideEffect(const std::string &kind);
/// Whether a kind of side effect takes a value.
bool sideEffectTakesValue(const std::string &kind);
/// Changes the state of the process; false when the value does not suit.
bool causeSideEffect(const std::string &kind, const std::string &value);
