#include "Main/AudioEngineController/Effects/Plugin/PluginBehaviour.h"

#include <vector>

namespace {

struct Behaviour {
    const char *pluginClass;
    const char *keyPart; ///< found anywhere in the plug-in's key
    bool isInstrument;
};

/// Handles are places in this table, from 1. No plug-in needs an entry so far.
const std::vector<Behaviour> &table()
{
    static const std::vector<Behaviour> entries;
    return entries;
}

} // namespace

int PluginBehaviour::lookUp(const QString &pluginClass, const QString &key)
{
    int handle = 0;
    for (const Behaviour &entry : table()) {
        ++handle;
        if (pluginClass == QLatin1String(entry.pluginClass) && key.contains(QLatin1String(entry.keyPart)))
            return handle;
    }
    return 0;
}

bool PluginBehaviour::isInstrument(int handle)
{
    return handle > 0 && table().at(static_cast<std::size_t>(handle) - 1).isInstrument;
}
