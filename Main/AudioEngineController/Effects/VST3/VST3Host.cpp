#include "Main/AudioEngineController/Effects/VST3/VST3Host.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST3/VST3ModuleFile.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Plugin.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Probe.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Query.h"

VST3Host::VST3Host()
    : CatalogueHost(PluginFormat::Vst3)
{}

bool VST3Host::isModule(const QString &path) const { return VST3ModuleFile::isModule(path); }

QString VST3Host::moduleTime(const QString &path) const { return VST3ModuleFile::fileTime(path); }

QString VST3Host::moduleLibrary(const QString &path) const
{
    QString reason;
    return VST3ModuleFile::binary(path, reason);
}

QString VST3Host::moduleFolder(const QString &path) const
{
    const QString bundle = bundleOf(path);
    return CatalogueHost::moduleFolder(bundle.isEmpty() ? path : bundle);
}

QString VST3Host::displayName(const QString &path) const
{
    return fileNameOf(path).chopped(info().moduleEnding.size());
}

std::unique_ptr<IPluginProbe> VST3Host::makeProbe() const { return std::make_unique<VST3Probe>(); }

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
