#include "Workstation/Summary/ScanSummary.h"

#include "Core/BaseLib/Files/AnswerInTime.h"

#include <QFileInfo>

#include <algorithm>
#include <set>

namespace {

constexpr std::size_t kSlowest = 5;

PluginKey keyOf(const CataloguedPlugin &plugin)
{
    return {plugin.format->format, plugin.record.path, plugin.record.subId};
}

using PluginIdentity = std::tuple<PluginFormat, QString, QString, quint32>;

/// What makes a plug-in the same in two catalogues; several classes share a file.
PluginIdentity identityOf(const CataloguedPlugin &plugin)
{
    const QString id = plugin.isUsableIfThere() ? plugin.record.id : QString();
    return {plugin.format->format, plugin.record.path, id, plugin.record.subId};
}

QString reasonOf(const CataloguedPlugin &plugin, const ScanAccount *account, const ProbeMemory &memory)
{
    if (plugin.isAway)
        return QStringLiteral("the folder that it lay in is not there, or is empty");
    if (plugin.isGone)
        return QStringLiteral(
            "its file is not there; a scan of all folders finds it elsewhere, or lets it go");
    const PluginKey key = keyOf(plugin);
    const PluginKey file{key.format, key.path, 0};
    for (const PluginKey &each : {key, file})
        if (const ProbeAccount *probe = account ? account->find(each) : nullptr;
            probe && !probe->reason.isEmpty())
            return probe->reason;
    const RememberedProbe *last = memory.find(key.format, key.path);
    const bool isOfFile =
        last && (last->fileTime == plugin.record.fileTime || plugin.record.fileTime.isEmpty());
    if (const QString reason = isOfFile ? last->reasonOf(key.subId) : QString(); !reason.isEmpty())
        return reason;
    if (plugin.isOfCrashedFile)
        return QStringLiteral("its file ended the scanner");
    if (plugin.isUnasked)
        return QStringLiteral("the next scan asks it");
    return plugin.state() == PluginState::Disabled ? QStringLiteral("it ended the scanner in an earlier scan")
                                                   : QStringLiteral("it failed in an earlier scan");
}

/// Whether nobody knows of a reason why a plug-in does not work, and the next scan looks at its file.
bool isUnasked(const CataloguedPlugin &plugin, const ScanAccount *account, const ProbeMemory &memory)
{
    const EffectRecord &record = plugin.record;
    if (!record.enabled || record.working || !record.fileTime.isEmpty())
        return false;
    const RememberedProbe *last = memory.find(plugin.format->format, record.path);
    return !(account && account->find({plugin.format->format, record.path, 0})) &&
           !(last && !last->reasonOf(record.subId).isEmpty());
}

void addFailures(ScanSummary &summary, const ScanAccount *account, const ProbeMemory &memory)
{
    for (CataloguedPlugin &plugin : summary.plugins) {
        if (plugin.isUsable() || plugin.isIgnored)
            continue;
        plugin.isUnasked = isUnasked(plugin, account, memory);
        plugin.reason = reasonOf(plugin, account, memory);
        summary.failures.push_back({plugin.format, plugin.state(), plugin.record.name, plugin.record.path,
                                    plugin.record.subId, plugin.reason, true, plugin.hasChanged});
    }
}

/// A catalogue may tell one direction only, the last probe tells both.
void fillChannels(std::vector<CataloguedPlugin> &plugins, const ProbeMemory &memory)
{
    using Channels = CatalogueFormat::Channels;
    for (CataloguedPlugin &plugin : plugins) {
        if (!plugin.isUsable())
            continue;
        const Channels told = plugin.format->catalogue->channels;
        plugin.inputs = told == Channels::Width ? -1 : plugin.record.inputs;
        plugin.outputs = told == Channels::Width  ? plugin.record.width
                         : told == Channels::Both ? plugin.record.outputs
                                                  : -1;
        const RememberedProbe *last = memory.find(plugin.format->format, plugin.record.path);
        if (!last || last->fileTime != plugin.record.fileTime)
            continue;
        for (const RememberedPlugin &each : last->plugins)
            if (each.id == plugin.record.id) {
                plugin.inputs = each.inputs;
                plugin.outputs = each.outputs;
            }
    }
}

/// Format and path of a file.
using FileIdentity = std::pair<PluginFormat, QString>;

FileIdentity fileOf(const CataloguedPlugin &plugin) { return {plugin.format->format, plugin.record.path}; }

/// Files that have no record in the catalogue: no plug-ins, or such that get none although they failed.
void addUnrecorded(ScanSummary &summary, const ScanAccount &account)
{
    std::set<FileIdentity> recorded;
    for (const CataloguedPlugin &plugin : summary.plugins)
        recorded.insert(fileOf(plugin));
    for (const auto &[key, probe] : account.probes()) {
        if (probe.reason.isEmpty() || recorded.count({key.format, key.path}) != 0)
            continue;
        const QString name = probe.subName.isEmpty() ? fileNameOf(key.path) : probe.subName;
        const bool isNoPlugin = probe.status == ProbeStatus::NoPlugin;
        const PluginState state = isNoPlugin                             ? PluginState::NoPlugin
                                  : probe.status == ProbeStatus::Skipped ? PluginState::Skipped
                                                                         : PluginState::Failed;
        (isNoPlugin ? summary.noPlugins : summary.failures)
            .push_back({&formatInfo(key.format), state, name, key.path, key.subId, probe.reason, false});
    }
}

/// The same from what earlier scans left: files that list nothing and are asked at each scan.
void addUnrecorded(ScanSummary &summary, const ProbeMemory &memory)
{
    std::set<FileIdentity> recorded;
    for (const CataloguedPlugin &plugin : summary.plugins)
        recorded.insert(fileOf(plugin));
    for (const PluginFormatInfo &format : pluginFormats())
        memory.forEach(format.format, [&](const RememberedProbe &probe) {
            const bool hasFailed = probe.status == ProbeStatus::Failed || isCrash(probe.status);
            if (hasFailed && recorded.count({format.format, probe.path}) == 0 && fileAnswers(probe.path) &&
                QFileInfo::exists(probe.path))
                summary.failures.push_back({&format, PluginState::Failed, fileNameOf(probe.path), probe.path,
                                            0, probe.reason, false});
        });
}

void count(ScanSummary &summary, const CatalogueView &before, const ScanAccount &account)
{
    std::map<PluginIdentity, QString> gone;
    std::set<FileIdentity> failedBefore; // what stood for the file says nothing of what is in it
    std::set<FileIdentity> filesBefore;
    for (const CataloguedPlugin &plugin : before.plugins) {
        filesBefore.insert(fileOf(plugin));
        if (plugin.isUsableIfThere() || plugin.record.subId != 0)
            gone.emplace(identityOf(plugin), plugin.record.name);
        else
            failedBefore.insert(fileOf(plugin));
    }
    std::set<FileIdentity> failedNow;
    for (const CataloguedPlugin &plugin : summary.plugins) {
        const FileIdentity file = fileOf(plugin);
        const bool standsForFile = !plugin.isUsableIfThere() && plugin.record.subId == 0;
        if (standsForFile)
            failedNow.insert(file);
        const bool wasKnown = gone.erase(identityOf(plugin)) + failedBefore.count(file) != 0 ||
                              (standsForFile && filesBefore.count(file) != 0);
        const ProbeAccount *probe = account.find({file.first, file.second, 0});
        const bool wasProbed =
            account.wasProbed(file.first, file.second) && !(probe && probe->status == ProbeStatus::Skipped);
        ++(!wasKnown ? summary.added : wasProbed ? summary.updated : summary.unchanged);
    }
    for (const auto &[identity, name] : gone)
        if (failedNow.count({std::get<0>(identity), std::get<1>(identity)}) == 0)
            summary.removed.append(name);
}

void addSkipped(ScanSummary &summary, const ScanAccount &account)
{
    for (const auto &[key, probe] : account.probes())
        if (probe.status == ProbeStatus::Skipped)
            summary.skipped.append(key.path);
}

void addSlowest(ScanSummary &summary, const ScanAccount &account)
{
    for (const auto &[key, probe] : account.probes())
        if (key.subId == 0 && probe.isLoaded && probe.milliseconds >= 0)
            summary.slowest.push_back({key.path, probe.milliseconds});
    const auto isSlower = [](const ProbeTime &a, const ProbeTime &b) {
        return a.milliseconds > b.milliseconds;
    };
    std::sort(summary.slowest.begin(), summary.slowest.end(), isSlower);
    if (summary.slowest.size() > kSlowest)
        summary.slowest.resize(kSlowest);
}

} // namespace

ScanSummary summariseCatalogue(CatalogueView now, const ProbeMemory &memory)
{
    ScanSummary summary;
    summary.plugins = std::move(now.plugins);
    summary.problems = std::move(now.problems);
    fillChannels(summary.plugins, memory);
    addFailures(summary, nullptr, memory);
    addUnrecorded(summary, memory);
    summary.duplicates = findDuplicates(summary.plugins, memory);
    return summary;
}

ScanSummary summariseScan(CatalogueView now, const CatalogueView &before, const ScanAccount &account,
                          const ProbeMemory &memory)
{
    ScanSummary summary;
    summary.isScan = true;
    summary.finished = account.isFinished();
    summary.plugins = std::move(now.plugins);
    summary.problems = account.problems() + now.problems;
    fillChannels(summary.plugins, memory);
    addFailures(summary, &account, memory);
    addUnrecorded(summary, account);
    count(summary, before, account);
    addSkipped(summary, account);
    addSlowest(summary, account);
    summary.duplicates = findDuplicates(summary.plugins, memory);
    summary.timeline = timelineOf(account);
    return summary;
}

std::size_t countOf(const ScanSummary &summary)
{
    const auto isCounted = [](const PluginFailure &failure) {
        return !failure.isCatalogued && failure.state != PluginState::Skipped;
    };
    const auto others = std::count_if(summary.failures.begin(), summary.failures.end(), isCounted);
    return summary.plugins.size() + static_cast<std::size_t>(others);
}

void keepPlugins(ScanSummary &summary, std::vector<CataloguedPlugin> plugins,
                 const std::function<bool(const PluginFailure &)> &isFileShown)
{
    std::set<PluginKey> shown;
    std::set<QString> paths;
    for (const CataloguedPlugin &plugin : plugins) {
        shown.insert(keyOf(plugin));
        paths.insert(plugin.record.path);
    }
    summary.plugins = std::move(plugins);
    const auto keep = [](auto &list, auto &&isKept) {
        const auto isOut = [&](const auto &each) { return !isKept(each); };
        list.erase(std::remove_if(list.begin(), list.end(), isOut), list.end());
    };
    keep(summary.noPlugins, isFileShown);
    keep(summary.failures, [&](const PluginFailure &failure) {
        return failure.isCatalogued ? shown.count({failure.format->format, failure.path, failure.subId}) != 0
                                    : isFileShown(failure);
    });
    for (const PluginFailure &failure : summary.failures)
        paths.insert(failure.path);
    keep(summary.slowest, [&](const ProbeTime &probe) { return paths.count(probe.path) != 0; });
    keep(summary.duplicates, [&](const Duplicate &duplicate) {
        return std::any_of(duplicate.members.begin(), duplicate.members.end(),
                           [&](const DuplicateMember &member) { return paths.count(member.path) != 0; });
    });
}
