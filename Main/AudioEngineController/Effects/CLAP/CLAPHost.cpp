#include "Main/AudioEngineController/Effects/CLAP/CLAPHost.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/CLAP/CLAPProbe.h"
#include "Main/AudioEngineController/Effects/Plugin/DummyAudioPlugin.h"

#include <QFileInfo>

CLAPHost::CLAPHost()
    : CatalogueHost(PluginFormat::Clap)
{}

bool CLAPHost::isModule(const QString &path) const
{
    // A folder of such a name holds a module and its data, or is another system's bundle.
    return CatalogueHost::isModule(path) && !QFileInfo(path).isDir();
}

std::unique_ptr<IPluginProbe> CLAPHost::makeProbe() const { return std::make_unique<CLAPProbe>(); }

LoadedPlugin CLAPHost::loadPlugin(const QString &identifier)
{
    const std::optional<EffectRecord> record = findEffect(identifier);
    if (!record)
        return {};
    DebugLog(L"%ls is a CLAP plug-in; these are listed only, and a placeholder takes its place",
             record->name);
    return {true,
            std::make_unique<DummyAudioPlugin>(QLatin1String(info().prefix) + identifier, record->name)};
}
