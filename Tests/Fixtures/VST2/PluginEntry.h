#pragma once

#include "Main/AudioEngineController/Effects/VST/VSTInterface.h"

#ifdef _WIN32
#define FIXTURE_EXPORT extern "C" __declspec(dllexport)
#else
#define FIXTURE_EXPORT extern "C" __attribute__((visibility("default")))
#endif

/// Which of a module's two entry points was called.
enum class EntryPoint {
    First,     ///< the only one, or the one that comes first
    SecondMain ///< "main" of a module that has both: its effects have other names and identifiers
};

/// What every entry point does: makes the effect, or the sub-plug-in that the host asks for.
AEffect *enterPlugin(audioMasterCallback host, EntryPoint entryPoint);
