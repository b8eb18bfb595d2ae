#include "Tests/Fixtures/VST2/PluginEntry.h"

// C++ has rules for a function of this name, so only its symbol has it.
FIXTURE_EXPORT AEffect *olderEntry(audioMasterCallback host) __asm__("main");

AEffect *olderEntry(audioMasterCallback host) { return enterPlugin(host, EntryPoint::FIXTURE_MAIN); }
