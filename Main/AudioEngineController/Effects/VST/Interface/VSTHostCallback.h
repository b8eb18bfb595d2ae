#pragma once

#include "Main/AudioEngineController/Effects/VST/Interface/VSTInterface.h"

/// The one function through which every VST 2 plug-in talks to the host (the `audioMasterCallback` of the
/// interface). Any thread. Answers from `VSTHostContext`; checks pointers of the plug-in for null and uses
/// them only for what the opcode says, and takes no lock that a scan holds while it calls a plug-in.
VstIntPtr VSTHostCallback(AEffect *effect, VstInt32 opcode, VstInt32 index, VstIntPtr value, void *ptr,
                          float opt);
