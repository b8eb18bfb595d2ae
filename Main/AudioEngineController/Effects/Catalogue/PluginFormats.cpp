#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include "Core/BaseLib/Binary/PluginLibrary.h"
#include "Core/BaseLib/Log/Assertion.h"
#include "Main/AudioEngineController/Effects/Catalogue/BuiltInCatalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/CLAPCatalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/VSTCatalogue.h"

#include <algorithm>

namespace {

template <typename Matches>
const PluginFormatInfo *find(Matches &&matches)
{
    const std::vector<PluginFormatInfo> &formats = pluginFormats();
    const auto found = std::find_if(formats.begin(), formats.end(), matches);
    return found == formats.end() ? nullptr : &*found;
}

const PluginFormatInfo *infoOfPrefix(const QString &prefix)
{
    return find([&](const PluginFormatInfo &info) { return prefix == QLatin1String(info.prefix); });
}

/// Where the path of the innermost folder ends that has the ending of bundles and `behind` follows; 0 when
/// there is none. A folder that is called like the ending and no more is no bundle, but one for such:
/// "~/.vst3".
int bundleEnd(const QString &path, const QString &behind)
{
    int end = 0;
    for (const PluginFormatInfo &info : pluginFormats()) {
        const QString boundary = info.moduleEnding + behind;
        int place = info.hasBundles ? path.lastIndexOf(boundary, -1, Qt::CaseInsensitive) : -1;
        while (place > 0 && path.at(place - 1) == QLatin1Char('/'))
            place = path.lastIndexOf(boundary, place - 1, Qt::CaseInsensitive);
        if (place > 0)
            end = std::max(end, place + info.moduleEnding.size());
    }
    return end;
}

} // namespace

const std::vector<PluginFormatInfo> &pluginFormats()
{
    static const std::vector<PluginFormatInfo> formats{
        {PluginFormat::Vst3, "vst3", "VST 3", PluginPrefix::kVst3, QStringLiteral(".vst3"),
         &vst3CatalogueFormat(), "vst3", "VST3_PATH", true},
        {PluginFormat::Vst2, "vst2", "VST 2", PluginPrefix::kVst2, PluginLibrary::fileEnding(),
         &vstCatalogueFormat(), nullptr, "VST_PATH LXVST_PATH"},
        {PluginFormat::Clap, "clap", "CLAP", PluginPrefix::kClap, QStringLiteral(".clap"),
         &clapCatalogueFormat(), "clap", "CLAP_PATH"},
        {PluginFormat::AudioUnit, "au", "Apple AudioUnit", PluginPrefix::kAudioUnit, QString(), nullptr},
        {PluginFormat::BuiltIn, "mrl", "Built-in", PluginPrefix::kBuiltIn, QString(),
         &builtInEffectsFormat()}};
    return formats;
}

const PluginFormatInfo &formatInfo(PluginFormat format)
{
    const PluginFormatInfo *const info =
        find([format](const PluginFormatInfo &each) { return each.format == format; });
    FXPROBE_VERIFY(0 != info);
    return info ? *info : pluginFormats().front();
}

const PluginFormatInfo *formatOfKey(const QString &key)
{
    return find([&](const PluginFormatInfo &info) { return key == QLatin1String(info.key); });
}

QString bundleOf(const QString &path)
{
    return path.left(bundleEnd(path, QLatin1String(kBundleContents) + QLatin1Char('/')));
}

bool isBelowBundle(const QString &path) { return bundleEnd(path, QStringLiteral("/")) > 0; }

bool isPartOfBundle(const QString &path)
{
    const PluginFormatInfo *const info = find([&](const PluginFormatInfo &each) {
        return each.isScanned() && path.endsWith(each.moduleEnding, Qt::CaseInsensitive);
    });
    return info && !info->hasBundles && isBelowBundle(path);
}

PluginFormat formatOfPrefix(const QString &prefix)
{
    const PluginFormatInfo *const info = infoOfPrefix(prefix);
    return info ? info->format : PluginFormat::Unknown;
}

QString prefixOf(const QString &identifier)
{
    return identifier.left(identifier.indexOf(QLatin1Char(':')) + 1);
}

QString formatName(const QString &prefix)
{
    const PluginFormatInfo *const info = infoOfPrefix(prefix);
    return info ? QString::fromLatin1(info->title) : QStringLiteral("Unknown");
}
