#include "Tests/Fixtures/VST3/ScriptedModule.h"

// The functions around a module's life, under their names on this platform.

extern "C" {

SMTG_EXPORT_SYMBOL bool InitDll()
{
    scriptedModule().stages.reach("module-entry");
    return !scriptedModule().answers("false", "module-entry");
}

SMTG_EXPORT_SYMBOL bool ExitDll()
{
    scriptedModule().stages.reach("module-exit");
    return !scriptedModule().answers("false", "module-exit");
}
}
