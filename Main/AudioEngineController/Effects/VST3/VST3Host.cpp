#include "Main/AudioEngineController/Effects/VST3/VST3Host.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/VST3/VST3FolderScan.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Plugin.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Query.h"

VST3Host::VST3Host()
    : AudioPluginHost(&vst3CatalogueFormat())
{}

bool VST3Host::Scan(bool scan, bool inProcess)
{
    return scan ? VST3FolderScan(*this).run() : AudioPluginHost::Scan(scan, inProcess);
}

LoadedPlugin VST3Host::loadPlugin(const QString &identifier)
{
    const std::optional<EffectRecord> record = findEffect(identifier);
    if (!record)
        return {};
    if (!record->enabled) {
        DebugLog(L"%ls is switched off and not loaded", record->name);
        return {true, nullptr};
    }
    auto plugin = std::make_unique<VST3Plugin>(); // outlives what is thrown, whose code the module holds
    try {
        if (plugin->openClass(*record))
            return {true, std::move(plugin)};
    } catch (...) {
        DebugLog(L"%ls: when it was loaded, %ls", record->name, thrownText());
    }
    DebugLog(L"%ls (%ls) could not be loaded", record->name, identifier);
    return {true, nullptr};
}

bool VST3Host::isMarkerWithoutRecord(const EffectRecord &marker) const
{
    // NOTE: a WaveShell holds the plug-ins of a whole vendor; one crash must not switch all of them off.
    return marker.name.contains(QLatin1String("WaveShell"));
}
