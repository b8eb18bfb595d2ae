#include "Main/AudioEngineController/Effects/Catalogue/PluginIdentifier.h"

namespace {

struct PrefixEntry {
    const char *prefix;
    PluginFormat format;
    const char *name;
};

constexpr PrefixEntry kPrefixes[] = {
    {PluginPrefix::kBuiltIn, PluginFormat::BuiltIn, "Built-in"},
    {PluginPrefix::kVst2, PluginFormat::Vst2, "VST 2"},
    {PluginPrefix::kAudioUnit, PluginFormat::AudioUnit, "Apple AudioUnit"},
    {PluginPrefix::kVst3, PluginFormat::Vst3, "VST 3"},
    {PluginPrefix::kPlaceholder, PluginFormat::Unknown, "Unknown"},
};

const PrefixEntry &entryOf(const QString &prefix)
{
    for (const PrefixEntry &entry : kPrefixes)
        if (prefix == QLatin1String(entry.prefix))
            return entry;
    static constexpr PrefixEntry kNone = {"", PluginFormat::Unknown, "Unknown"};
    return kNone;
}

} // namespace

PluginFormat formatOfPrefix(const QString &prefix) { return entryOf(prefix).format; }

QString prefixOf(const QString &identifier)
{
    return identifier.left(identifier.indexOf(QLatin1Char(':')) + 1);
}

QString formatName(const QString &prefix) { return QString::fromLatin1(entryOf(prefix).name); }
