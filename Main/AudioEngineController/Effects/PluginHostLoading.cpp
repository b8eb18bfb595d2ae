#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/Plugin/DummyAudioPlugin.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"

std::unique_ptr<AudioPlugin> PluginHost::LoadPlugin(const QString &identifier)
{
    const QString prefix = prefixOf(identifier);
    const QString name = identifier.mid(prefix.size());
    if (prefix == QLatin1String(PluginPrefix::kPlaceholder) && !name.isEmpty())
        return std::make_unique<DummyAudioPlugin>(name);
    const auto host = m_hosts.find(formatOfPrefix(prefix));
    LoadedPlugin loaded = host != m_hosts.end() ? host->second->loadPlugin(name) : LoadedPlugin();
    if (!loaded.isKnown)
        DebugLog(L"PluginHost::LoadPlugin - Failed to Find Effect: %ls", identifier);
    return std::move(loaded.plugin);
}
