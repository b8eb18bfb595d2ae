#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginIdentifier.h"
#include "Main/AudioEngineController/Effects/Plugin/DummyAudioPlugin.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"

AudioPluginHost *PluginHost::hostOfPrefix(const QString &prefix)
{
    switch (formatOfPrefix(prefix)) {
    case PluginFormat::Vst2:
        return m_hosts[0].get();
    case PluginFormat::Vst3:
        return m_hosts[1].get();
    case PluginFormat::AudioUnit:
        return m_hosts[2].get();
    case PluginFormat::BuiltIn:
        return m_hosts[3].get();
    case PluginFormat::Unknown:
        break;
    }
    return nullptr;
}

std::unique_ptr<AudioPlugin> PluginHost::LoadPlugin(const QString &identifier)
{
    const QString prefix = prefixOf(identifier);
    const QString name = identifier.mid(prefix.size());
    if (prefix == QLatin1String(PluginPrefix::kPlaceholder) && !name.isEmpty())
        return std::make_unique<DummyAudioPlugin>(name);
    AudioPluginHost *const host = hostOfPrefix(prefix);
    LoadedPlugin loaded = host ? host->loadPlugin(name) : LoadedPlugin();
    if (!loaded.isKnown)
        DebugLog(L"PluginHost::LoadPlugin - Failed to Find Effect: %ls", identifier);
    return std::move(loaded.plugin);
}
