#pragma once

#include <string>
#include <vector>

/// A way in which a plug-in spoils the state of the process.
struct Spoiling {
    const char *name;
    void (*spoil)();
};

/// Brings the process into a state that each of them changes.
void prepareState();
/// All that they change, as one text.
std::string wholeState();
std::vector<Spoiling> spoilings();
