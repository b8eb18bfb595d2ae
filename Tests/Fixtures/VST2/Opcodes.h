#pragma once

#include "Tests/Fixtures/FixtureStages.h"

#include "Main/AudioEngineController/Effects/VST/VSTInterface.h"

/// The stages of a VST 2 plug-in's life.
std::vector<FixtureStage> stagesOfVST2();
/// The stage at which a dispatcher opcode is reached.
std::string stageOfOpcode(int opcode);
/// Whether a call with this opcode must hand over a pointer.
bool needsPointer(int opcode);
/// What the trace tells about a call of the dispatcher; empty where all is zero.
std::string callDetail(int opcode, int index, VstIntPtr value, const void *pointer, float opt);
/// A number as a text, whatever the locale.
std::string floatText(float value);
