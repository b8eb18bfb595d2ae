#include "Tests/Fixtures/VST2/PluginEntry.h"

FIXTURE_EXPORT AEffect *VSTPluginMain(audioMasterCallback host)
{
    return enterPlugin(host, EntryPoint::First);
}
