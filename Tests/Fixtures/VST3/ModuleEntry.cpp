#include "Tests/Fixtures/VST3/VST3Script.h"

// The functions around a module's life, under their names on Linux and on Windows.

static bool passStage(const char *stage, const char *detail)
{
    script().reach(stage, {}, detail);
    return script().answer(stage).empty();
}

extern "C" {
SMTG_EXPORT_SYMBOL bool ModuleEntry(void *handle)
{
    return passStage("module-entry", handle ? "" : "no handle");
}
SMTG_EXPORT_SYMBOL bool ModuleExit() { return passStage("module-exit", ""); }
SMTG_EXPORT_SYMBOL bool InitDll() { return passStage("module-entry", ""); }
SMTG_EXPORT_SYMBOL bool ExitDll() { return passStage("module-exit", ""); }
}
