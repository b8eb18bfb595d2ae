#include "Workstation/ShowCommand.h"

#include "Workstation/Manage/PluginNames.h"

#include <algorithm>
#include <set>

namespace {

/// Files that are not in the catalogue, by name: a copy leads to the plug-ins that are used in its place.
QStringList usedInsteadOf(const QString &name, const ProbeMemory &memory, QString &reason)
{
    QStringList paths;
    for (const PluginFormatInfo &format : pluginFormats())
        memory.forEach(format.format, [&](const RememberedProbe &probe) {
            if (!isFileNamed(name, probe.path))
                return;
            reason = QStringLiteral("%1: %2").arg(
                probe.path, probe.reason.isEmpty()
                                ? QStringLiteral("nothing is known of it any more; scan it again")
                                : probe.reason);
            for (const RememberedPlugin &plugin : probe.plugins)
                if (!plugin.heldBy.isEmpty())
                    paths.append(plugin.heldBy);
        });
    return paths;
}

} // namespace

QStringList keepNamed(ScanSummary &summary, const QStringList &names, const ProbeMemory &memory)
{
    QStringList unknown;
    std::vector<const EffectRecord *> records;
    for (const CataloguedPlugin &plugin : summary.plugins)
        records.push_back(&plugin.record);
    std::set<std::size_t> kept;
    const auto keep = [&](const QString &name) {
        const NamedPlugins named = pluginsNamed(name, records);
        kept.insert(named.places.begin(), named.places.end());
        return !named.places.empty();
    };
    for (const QString &name : names) {
        if (keep(name))
            continue;
        QString reason = QStringLiteral("no plug-in is named '%1'").arg(name);
        const QStringList used = usedInsteadOf(name, memory, reason);
        if (std::count_if(used.begin(), used.end(), keep) == 0)
            unknown.append(reason);
    }
    std::vector<CataloguedPlugin> plugins;
    for (const std::size_t place : kept) {
        plugins.push_back(summary.plugins[place]);
        CataloguedPlugin &plugin = plugins.back();
        if (const RememberedProbe *last = memory.find(plugin.format->format, plugin.record.path))
            plugin.probe = *last;
    }
    keepPlugins(summary, std::move(plugins), [](const PluginFailure &) { return false; });
    summary.problems.clear();
    return unknown;
}
