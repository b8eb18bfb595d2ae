#pragma once

#include "Main/AudioEngineController/Effects/VST/VSTInterface.h"

#include <string>

/// Whether a call with this opcode must hand over a pointer.
bool needsPointer(int opcode);
/// What the trace tells about a call of the dispatcher; empty where all is zero.
std::string callDetail(int opcode, int index, VstIntPtr value, const void *pointer, float opt);
/// A number as a text, whatever the locale.
std::string floatText(float value);
