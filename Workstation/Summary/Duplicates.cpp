#include "Workstation/Summary/Duplicates.h"

#include "Core/BaseLib/Files/AnswerInTime.h"

#include <QFileInfo>

#include <algorithm>
#include <map>
#include <set>

namespace {

/// A plug-in's own name: the catalogue has another one where two files have plug-ins of one name.
QString ownName(const CataloguedPlugin &plugin, const ProbeMemory &memory)
{
    if (const RememberedProbe *last = memory.find(plugin.format->format, plugin.record.path))
        for (const RememberedPlugin &each : last->plugins)
            if (each.id == plugin.record.id && !each.name.isEmpty())
                return each.name;
    return plugin.record.name;
}

/// Finds the group of each plug-in.
class Groups {
public:
    Groups(const std::vector<CataloguedPlugin> &plugins, const ProbeMemory &memory)
    {
        for (const CataloguedPlugin &plugin : plugins)
            add(plugin, ownName(plugin, memory));
        for (const PluginFormatInfo &format : pluginFormats())
            memory.forEach(format.format, [&](const RememberedProbe &probe) { addCopy(format, probe); });
    }

    std::vector<Duplicate> duplicates() &&
    {
        m_groups.erase(std::remove_if(m_groups.begin(), m_groups.end(),
                                      [](const Duplicate &group) { return group.members.size() < 2; }),
                       m_groups.end());
        for (Duplicate &group : m_groups)
            std::stable_sort(group.members.begin(), group.members.end(),
                             [](const DuplicateMember &left, const DuplicateMember &right) {
                                 // Formats lie in one table, in their order.
                                 return std::make_pair(!left.isUsed, left.format) <
                                        std::make_pair(!right.isUsed, right.format);
                             });
        return std::move(m_groups);
    }

private:
    void add(const CataloguedPlugin &plugin, const QString &name)
    {
        // Of a plug-in without a vendor nobody knows whether it is another's namesake.
        const auto key = std::make_pair(plugin.record.vendor.toCaseFolded(), name.toCaseFolded());
        std::size_t place = m_groups.size();
        if (!plugin.record.vendor.isEmpty())
            place = m_places.emplace(key, place).first->second;
        if (place == m_groups.size())
            m_groups.push_back({name, plugin.record.vendor, {}});
        const bool isUsed = plugin.state() == PluginState::Ok;
        m_groups[place].members.push_back(
            {plugin.format, plugin.record.path, isUsed,
             isUsed ? QString() : QString::fromLatin1(stateText(plugin.state()))});
        m_holders[{plugin.format, plugin.record.path, plugin.record.id}] = place;
    }

    void addCopy(const PluginFormatInfo &format, const RememberedProbe &probe)
    {
        if (isCrash(probe.status) || !fileAnswers(probe.path) || !QFileInfo::exists(probe.path))
            return; // not used whatever the others do, or gone since
        for (const RememberedPlugin &plugin : probe.plugins) {
            const auto holder = m_holders.find({&format, plugin.heldBy, plugin.id});
            if (plugin.heldBy.isEmpty() || holder == m_holders.end())
                continue;
            Duplicate &group = m_groups[holder->second];
            // Of another name it is another plug-in, whose maker gave two the same identifier.
            const bool isCopy =
                plugin.name.isEmpty() || plugin.name.compare(group.name, Qt::CaseInsensitive) == 0;
            const QString reason = isCopy ? QStringLiteral("a copy of %1").arg(plugin.heldBy)
                                          : QStringLiteral("%1, which has the same identifier as %2")
                                                .arg(plugin.name, plugin.heldBy);
            group.members.push_back({&format, probe.path, false, reason});
        }
    }

    using Holder = std::tuple<const PluginFormatInfo *, QString, QString>; ///< format, path, identifier

    std::vector<Duplicate> m_groups;
    std::map<std::pair<QString, QString>, std::size_t> m_places; ///< by vendor and name
    std::map<Holder, std::size_t> m_holders;
};

} // namespace

bool Duplicate::isOneOfEachFormat() const
{
    std::set<const PluginFormatInfo *> formats;
    return std::all_of(members.begin(), members.end(), [&](const DuplicateMember &member) {
        return member.isUsed && formats.insert(member.format).second;
    });
}

std::vector<Duplicate> findDuplicates(const std::vector<CataloguedPlugin> &plugins, const ProbeMemory &memory)
{
    return Groups(plugins, memory).duplicates();
}
