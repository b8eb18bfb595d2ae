#include "Workstation/Manage/Marks.h"

#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"
#include "Workstation/Manage/CatalogueEdit.h"
#include "Workstation/Manage/PluginNames.h"

#include <algorithm>

namespace {

using Plugin = CatalogueEdit::Plugin;

/// Changes marks, and tells each change in words.
class Marker {
public:
    Marker(const CatalogueEdit &edit, const ProbeMemory &memory)
        : m_edit(edit)
        , m_memory(memory)
    {}

    QString switchOff(const Plugin &plugin) const
    {
        EffectRecord &record = *plugin.record;
        if (record.isSwitchedOff())
            return QStringLiteral("is switched off already");
        if (!record.working)
            return QStringLiteral("cannot be used, so there is nothing to switch off");
        record.enabled = false;
        return QStringLiteral("switched off");
    }

    QString switchOn(const Plugin &plugin) const
    {
        EffectRecord &record = *plugin.record;
        if (!record.isSwitchedOff())
            return record.working ? QStringLiteral("is switched on already")
                                  : QStringLiteral("is not switched off; it cannot be used");
        record.enabled = true;
        const std::optional<ProbeStatus> failure = failureOf(plugin);
        if (!failure)
            return QStringLiteral("switched on");
        record.working = false;
        record.enabled = *failure == ProbeStatus::Failed;
        return QStringLiteral("switched on, but it cannot be used");
    }

    QString setFavourite(const Plugin &plugin, bool isFavourite) const
    {
        if (plugin.record->favourite == isFavourite)
            return isFavourite ? QStringLiteral("is a favourite already")
                               : QStringLiteral("is not a favourite");
        plugin.record->favourite = isFavourite;
        return isFavourite ? QStringLiteral("is a favourite now")
                           : QStringLiteral("is not a favourite any more");
    }

private:
    /// How the file failed while the plug-in was switched off; nothing when it did not.
    std::optional<ProbeStatus> failureOf(const Plugin &plugin) const
    {
        for (const Plugin &each : m_edit.pluginsOf(*plugin.format, plugin.record->path))
            if (each.isHidden)
                return each.record->enabled ? ProbeStatus::Failed : ProbeStatus::Crashed;
        const RememberedProbe *last = m_memory.find(plugin.format->format, plugin.record->path);
        const bool hasFailed = last && last->status != ProbeStatus::Listed;
        if (hasFailed)
            return last->status;
        return last && !last->reasonOf(plugin.record->subId).isEmpty()
                   ? std::make_optional(ProbeStatus::Failed)
                   : std::nullopt;
    }

    const CatalogueEdit &m_edit;
    const ProbeMemory &m_memory;
};

std::vector<Plugin> shownPlugins(const CatalogueEdit &edit)
{
    std::vector<Plugin> shown;
    std::copy_if(edit.plugins().begin(), edit.plugins().end(), std::back_inserter(shown),
                 [](const Plugin &plugin) { return !plugin.isHidden; });
    return shown;
}

/// Why a name means none of the plug-ins that the catalogue lists.
QString whyUnknown(const QString &name, const ProbeMemory &memory)
{
    const UnlistedFile file = unlistedFileNamed(name, memory);
    if (!file.usedInstead.isEmpty())
        return QStringLiteral("'%1' is not used; use the path of what is used in its place:\n  ").arg(name) +
               file.usedInstead.join(QLatin1String("\n  "));
    return file.reason.isEmpty() ? QStringLiteral("no plug-in is named '%1'").arg(name) : file.reason;
}

} // namespace

MarkOutcome setMarks(const QString &effectsFolder, const MarkRequest &request)
{
    MarkOutcome outcome;
    CatalogueEdit edit(effectsFolder);
    const ProbeMemory memory(effectsFolder);
    const Marker marker(edit, memory);
    const std::vector<Plugin> shown = shownPlugins(edit);
    std::vector<const EffectRecord *> records;
    for (const Plugin &plugin : shown)
        records.push_back(plugin.record);
    const auto mark = [&](const QStringList &names, auto &&change) {
        for (const QString &name : names) {
            const NamedPlugins named = pluginsNamed(name, records);
            if (named.isAmbiguous())
                outcome.wrong.append(named.question(name));
            else if (named.places.empty())
                outcome.wrong.append(whyUnknown(name, memory));
            else
                for (const std::size_t place : named.places)
                    outcome.done.append(QStringLiteral("%1 (%2): %3")
                                            .arg(shown[place].record->name,
                                                 QLatin1String(shown[place].format->title),
                                                 change(shown[place])));
        }
    };
    mark(request.switchOff, [&](const Plugin &plugin) { return marker.switchOff(plugin); });
    mark(request.switchOn, [&](const Plugin &plugin) { return marker.switchOn(plugin); });
    mark(request.favourite, [&](const Plugin &plugin) { return marker.setFavourite(plugin, true); });
    mark(request.noFavourite, [&](const Plugin &plugin) { return marker.setFavourite(plugin, false); });
    if (outcome.wrong.isEmpty())
        outcome.written = edit.write();
    return outcome;
}
