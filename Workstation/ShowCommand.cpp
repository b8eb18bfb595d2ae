#include "Workstation/ShowCommand.h"

#include "Workstation/Manage/PluginNames.h"

#include <algorithm>
#include <set>

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
        const auto [reason, used] = unlistedFileNamed(name, memory);
        if (std::count_if(used.begin(), used.end(), keep) == 0)
            unknown.append(reason.isEmpty() ? QStringLiteral("no plug-in is named '%1'").arg(name) : reason);
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
