#include "Workstation/Manage/AskAgain.h"

#include "Core/BaseLib/Binary/LoadFailure.h"
#include "Core/BaseLib/Files/AnswerInTime.h"
#include "Core/BaseLib/Files/FileFinder.h"
#include "Main/AudioEngineController/Effects/Protocol/FolderRules.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"
#include "Workstation/Manage/CatalogueEdit.h"
#include "Workstation/Manage/PluginNames.h"

#include <algorithm>
#include <set>

namespace {

using Plugin = CatalogueEdit::Plugin;
using FileKey = std::pair<PluginFormat, QString>; ///< of a path without what file names do not tell apart

FileKey fileOf(const Plugin &plugin) { return {plugin.format->format, pathKey(plugin.record->path)}; }

/// It ended the process that probed it, or gave no answer.
bool isKiller(const EffectRecord &record) { return !record.enabled && !record.working; }

/// Whether something is true of all plug-ins that a name means, and there are some.
bool areAll(const std::vector<Plugin> &meant, bool (*is)(const EffectRecord &record))
{
    return !meant.empty() &&
           std::all_of(meant.begin(), meant.end(), [is](const Plugin &plugin) { return is(*plugin.record); });
}

/// Why what is meant by a name cannot be asked at all; empty when it can.
QString whyNeverAsked(const QString &name, const std::vector<Plugin> &meant)
{
    const bool areIgnored = areAll(meant, [](const EffectRecord &record) { return record.isIgnored(); });
    return areIgnored ? QStringLiteral("'%1' is ignored; --no-ignore its path first").arg(name) : QString();
}

/// Why a scan leaves alone what is meant by a name; empty when it does not.
QString whyNotAsked(const QString &name, const std::vector<Plugin> &meant)
{
    if (const QString why = whyNeverAsked(name, meant); !why.isEmpty())
        return why;
    if (areAll(meant, isKiller))
        return QStringLiteral("'%1' is disabled; --retry asks it again").arg(name);
    if (areAll(meant, [](const EffectRecord &record) { return !record.enabled; }))
        return QStringLiteral("'%1' is switched off; --switch-on it first").arg(name);
    return QString();
}

QStringList moduleEndings()
{
    QStringList endings;
    for (const PluginFormatInfo &format : pluginFormats())
        if (format.isScanned())
            endings.append(format.moduleEnding);
    return endings;
}

class Request {
public:
    Request(const QString &effectsFolder, const QStringList &below, const QStringList &folders,
            const ModuleLook &look)
        : m_edit(effectsFolder)
        , m_memory(effectsFolder)
        , m_below(below)
        , m_folders(folders)
        , m_finder(moduleEndings())
        , m_look(look)
    {
        m_finder.setArea({{}, readFolderRules(effectsFolder).excluded});
        m_finder.setPatience(std::chrono::seconds(10), [](const QString &) {});
    }

    void retry(const QStringList &names);
    void retryIf(const std::function<bool(const Plugin &)> &isMeant);
    void rescan(const QStringList &names);
    void rescanAll();
    bool mayWorkNow(const Plugin &plugin) const;

    AskAgainOutcome apply();

private:
    std::vector<Plugin> those(const std::function<bool(const Plugin &)> &isMeant) const;
    std::vector<Plugin> named(const QString &name, const std::vector<Plugin> &plugins, const QString &kind);
    bool isUnrecorded(const QString &name);
    void reopen(const std::vector<Plugin> &chosen) const;

    CatalogueEdit m_edit;
    ProbeMemory m_memory;
    QStringList m_below;
    QStringList m_folders;
    FileFinder m_finder;
    const ModuleLook &m_look;
    std::vector<Plugin> m_retried;
    std::set<FileKey> m_rescanned;
    QStringList m_wrong;
};

std::vector<Plugin> Request::those(const std::function<bool(const Plugin &)> &isMeant) const
{
    std::vector<Plugin> plugins;
    const auto isBelowOne = [this](const QString &path) {
        return m_below.isEmpty() || std::any_of(m_below.begin(), m_below.end(),
                                                [&](const QString &folder) { return isBelow(path, folder); });
    };
    std::copy_if(m_edit.plugins().begin(), m_edit.plugins().end(), std::back_inserter(plugins),
                 [&](const Plugin &plugin) { return isBelowOne(plugin.record->path) && isMeant(plugin); });
    return plugins;
}

/// Those that a name means; complains when it means none, unless it is that of a file without a record.
std::vector<Plugin> Request::named(const QString &name, const std::vector<Plugin> &plugins,
                                   const QString &kind)
{
    std::vector<const EffectRecord *> records;
    for (const Plugin &plugin : plugins)
        records.push_back(plugin.record);
    const NamedPlugins found = pluginsNamed(name, records);
    if (found.isAmbiguous())
        m_wrong.append(found.question(name));
    else if (found.places.empty() && !isUnrecorded(name))
        m_wrong.append(
            QStringLiteral("no %1 is named '%2'%3")
                .arg(kind, name, QLatin1String(m_below.isEmpty() ? "" : " in the folders that are scanned")));
    std::vector<Plugin> meant;
    for (const std::size_t place : found.isAmbiguous() ? std::vector<std::size_t>() : found.places)
        meant.push_back(plugins[place]);
    return meant;
}

/// Whether a file of that name lies in the folders that are scanned and has no record. A copy of a known
/// plug-in is forgotten, so that it is asked.
bool Request::isUnrecorded(const QString &name)
{
    bool isFound = false;
    for (const PluginFormatInfo &format : pluginFormats())
        for (const QString &path :
             format.isScanned() ? m_finder.find(m_folders, format.moduleEnding) : QStringList())
            if (isFileNamed(name, path) && m_edit.pluginsOf(format, path).empty()) {
                isFound = true;
                m_memory.keepOnly(format.format,
                                  [&path](const QString &other) { return !isSamePath(path, other); });
            }
    return isFound;
}

void Request::retry(const QStringList &names)
{
    const std::vector<Plugin> outOfUse = those([](const Plugin &plugin) { return !plugin.record->working; });
    for (const QString &name : names) {
        const std::vector<Plugin> meant = named(name, outOfUse, QStringLiteral("disabled or failed plug-in"));
        if (const QString why = whyNeverAsked(name, meant); !why.isEmpty())
            m_wrong.append(why);
        m_retried.insert(m_retried.end(), meant.begin(), meant.end());
    }
}

void Request::retryIf(const std::function<bool(const Plugin &)> &isMeant)
{
    for (const Plugin &plugin :
         those([&](const Plugin &each) { return !each.record->working && isMeant(each); }))
        m_retried.push_back(plugin);
}

bool Request::mayWorkNow(const Plugin &plugin) const
{
    const EffectRecord &record = *plugin.record;
    const PluginFormat format = plugin.format->format;
    if (!fileAnswers(record.path))
        return false;
    const QString fileTime = m_look.fileTime(format, record.path);
    if (fileTime.isEmpty())
        return false;
    if (isKiller(record) && fileTime != record.fileTime)
        return true;
    const RememberedProbe *last = m_memory.find(format, record.path);
    return last && last->status == ProbeStatus::Failed && last->fileTime == fileTime &&
           last->reason.startsWith(QLatin1String(kNeedsLibrary)) && m_look.hasLibraries(format, record.path);
}

void Request::rescan(const QStringList &names)
{
    const std::vector<Plugin> all = those([](const Plugin &) { return true; });
    for (const QString &name : names) {
        const std::vector<Plugin> meant = named(name, all, QStringLiteral("plug-in"));
        if (const QString why = whyNotAsked(name, meant); !why.isEmpty())
            m_wrong.append(why);
        for (const Plugin &plugin : meant)
            m_rescanned.insert(fileOf(plugin));
    }
}

void Request::rescanAll()
{
    // A file that is left alone keeps its time stamp: what its last probe told is known by it.
    for (const Plugin &plugin : those([](const Plugin &each) { return each.record->enabled; }))
        m_rescanned.insert(fileOf(plugin));
}

/// Gives records another chance. Any of a file's records may be the one that speaks for it, and keep it from
/// being touched. But a sub-plug-in that killed the scanner is loaded again only when it, or its whole file,
/// was meant.
void Request::reopen(const std::vector<Plugin> &chosen) const
{
    std::set<FileKey> files;
    std::set<FileKey> wholeFiles;
    std::set<const EffectRecord *> records;
    for (const Plugin &plugin : chosen) {
        files.insert(fileOf(plugin));
        records.insert(plugin.record);
        if (plugin.record->subId == 0)
            wholeFiles.insert(fileOf(plugin));
    }
    for (const Plugin &plugin : m_edit.plugins()) {
        EffectRecord &record = *plugin.record;
        const bool isOtherChild = records.count(&record) == 0 && record.subId != 0 && isKiller(record) &&
                                  wholeFiles.count(fileOf(plugin)) == 0;
        if (files.count(fileOf(plugin)) == 0 || isOtherChild)
            continue;
        record.fileTime.clear();
        record.enabled |= !record.working;
    }
}

AskAgainOutcome Request::apply()
{
    if (!m_wrong.isEmpty())
        return {m_wrong, {}};
    for (const Plugin &plugin : m_edit.plugins()) // a killer's time stamp keeps it from being loaded
        if (m_rescanned.count(fileOf(plugin)) != 0 && !isKiller(*plugin.record))
            plugin.record->fileTime.clear();
    reopen(m_retried);
    const FileResult written = m_edit.write();
    const FileResult remembered = m_memory.write();
    return {{}, written ? remembered : written};
}

} // namespace

AskAgainOutcome askAgain(const QString &effectsFolder, const AskAgainRequest &request,
                         const QStringList &folders, const ModuleLook &look)
{
    Request again(effectsFolder, request.below, folders, look);
    again.retry(request.retry);
    if (request.retryFailed)
        again.retryIf([](const Plugin &) { return true; });
    if (request.retryChanged)
        again.retryIf([&again](const Plugin &plugin) { return again.mayWorkNow(plugin); });
    again.rescan(request.rescan);
    if (request.rescanAll)
        again.rescanAll();
    return again.apply();
}
