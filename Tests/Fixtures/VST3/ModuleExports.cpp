#include "Tests/Fixtures/VST3/ScriptedFactory.h"

namespace {

/// Runs the script's first and last stage with the library's own start-up and shutdown code.
struct ModuleLife {
    ModuleLife() { scriptedModule().stages.reach("static-constructor"); }
    ~ModuleLife() { scriptedModule().stages.reach("static-destructor"); }
} moduleLife;

} // namespace

extern "C" {

SMTG_EXPORT_SYMBOL Steinberg::IPluginFactory *PLUGIN_API GetPluginFactory()
{
    static ScriptedFactory factory;
    scriptedModule().stages.reach("get-factory");
    if (scriptedModule().answers("null", "get-factory"))
        return nullptr;
    factory.addRef();
    return &factory;
}
}
