#pragma once

#include "Tests/Fixtures/FixtureScript.h"

#include "Main/AudioEngineController/Effects/VST/VSTInterface.h"

/// What the script beside the VST 2 module says.
const FixtureScript &script();
bool isShell();
/// What comes after the listed children: "endless", "repeat" or nothing.
std::string afterChildren();

/// The stage at which a dispatcher opcode is reached.
std::string stageOf(int opcode);
/// Whether a call with this opcode must hand over a pointer.
bool needsPointer(int opcode);
/// What the trace tells about a call of the dispatcher; empty where all is zero.
std::string detailOf(int opcode, int index, VstIntPtr value, const void *pointer, float opt);

/// One call of the host's callback that the script asks for.
struct HostCall {
    int opcode = 0, index = 0, value = 0;
    int depth = 1; ///< how many calls the host has active then, this one counted
    float opt = 0;
    bool fromThread = false, untilClose = false;

    /// Reads the words behind "ask-host".
    explicit HostCall(const FixtureScript::Words &words);
};
