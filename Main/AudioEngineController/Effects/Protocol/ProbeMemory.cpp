#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"

#include "Core/BaseLib/Files/NativeFile.h"
#include "Main/AudioEngineController/Effects/Protocol/ReportLines.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>
#include <iterator>

namespace {

using namespace ReportWord;

constexpr char kVersion[] = "version";
constexpr int kThisVersion = 1;
constexpr char kFileTime[] = "fileTime";
constexpr char kPlugins[] = "plugins";
constexpr char kId[] = "id";
constexpr char kInputs[] = "inputs";
constexpr char kOutputs[] = "outputs";
constexpr char kHeldBy[] = "heldBy";
constexpr char kName[] = "name";
constexpr char kFrames[] = "frames";
constexpr char kUnsettled[] = "unsettled";

/// In the order of `ProbeStatus`.
constexpr const char *kStatusTexts[] = {"listed",    "failed",    "no plug-in", "crashed",
                                        "no answer", "cancelled", "skipped"};

QLatin1String word(const char *text) { return QLatin1String(text); }

/// Inserts what is there: most plug-ins have no reason and no holder.
void insertText(QJsonObject &object, const char *name, const QString &text)
{
    if (!text.isEmpty())
        object.insert(word(name), text);
}

void insertTexts(QJsonObject &object, const char *name, const QStringList &texts)
{
    if (!texts.isEmpty())
        object.insert(word(name), QJsonArray::fromStringList(texts));
}

QStringList textsOf(const QJsonValue &value)
{
    QStringList texts;
    for (const QJsonValue text : value.toArray())
        texts.append(text.toString());
    return texts;
}

QJsonObject jsonOf(const RememberedPlugin &plugin)
{
    QJsonObject object;
    insertText(object, kId, plugin.id);
    if (plugin.subId != 0)
        object.insert(word(kSubId), static_cast<qint64>(plugin.subId));
    insertText(object, kReason, plugin.reason);
    if (plugin.inputs >= 0)
        object.insert(word(kInputs), plugin.inputs);
    if (plugin.outputs >= 0)
        object.insert(word(kOutputs), plugin.outputs);
    insertText(object, kHeldBy, plugin.heldBy);
    insertText(object, kName, plugin.name);
    insertTexts(object, kFrames, plugin.frames);
    return object;
}

QByteArray render(const RememberedProbe &probe)
{
    QJsonArray plugins;
    for (const RememberedPlugin &plugin : probe.plugins)
        plugins.append(jsonOf(plugin));
    QJsonObject object{{word(kFormat), word(formatInfo(probe.format).key)},
                       {word(kPath), probe.path},
                       {word(kFileTime), probe.fileTime},
                       {word(kStatus), word(statusText(probe.status))},
                       {word(kStage), word(stageText(probe.stage))},
                       {word(kMilliseconds), probe.milliseconds}};
    insertText(object, kReason, probe.reason);
    insertTexts(object, kFrames, probe.frames);
    if (probe.isUnsettled)
        object.insert(word(kUnsettled), true);
    if (!plugins.isEmpty())
        object.insert(word(kPlugins), plugins);
    return QJsonDocument(object).toJson(QJsonDocument::Compact);
}

/// A number of channels; -1 for anything else.
qint32 channelsOf(const QJsonValue &value) { return std::max(value.toInt(-1), -1); }

RememberedPlugin pluginOf(const QJsonObject &object)
{
    RememberedPlugin plugin;
    plugin.id = object.value(word(kId)).toString();
    plugin.subId = subIdOf(object.value(word(kSubId)));
    plugin.reason = object.value(word(kReason)).toString();
    plugin.inputs = channelsOf(object.value(word(kInputs)));
    plugin.outputs = channelsOf(object.value(word(kOutputs)));
    plugin.heldBy = object.value(word(kHeldBy)).toString();
    plugin.name = object.value(word(kName)).toString();
    plugin.frames = textsOf(object.value(word(kFrames)));
    return plugin;
}

/// The place of a text in a table; the first one for a text that is not there.
template <typename Enum, std::size_t Size>
Enum enumOf(const QString &text, const char *const (&texts)[Size])
{
    const auto found = std::find_if(std::begin(texts), std::end(texts),
                                    [&](const char *each) { return text == word(each); });
    return found == std::end(texts) ? Enum{} : static_cast<Enum>(std::distance(std::begin(texts), found));
}

RememberedProbe probeOf(const QJsonObject &object)
{
    RememberedProbe probe;
    const PluginFormatInfo *const format = formatOfKey(object.value(word(kFormat)).toString());
    const std::optional<ProbeStatus> status = statusOfText(object.value(word(kStatus)).toString());
    if (format && status) // else it is of another version, and nobody knows what it says
        probe.format = format->format;
    probe.path = object.value(word(kPath)).toString();
    probe.fileTime = object.value(word(kFileTime)).toString();
    probe.status = status.value_or(ProbeStatus::Listed);
    probe.stage = enumOf<ProbeStage>(object.value(word(kStage)).toString(), kStages);
    probe.reason = object.value(word(kReason)).toString();
    probe.frames = textsOf(object.value(word(kFrames)));
    probe.milliseconds = object.value(word(kMilliseconds)).toDouble();
    probe.isUnsettled = object.value(word(kUnsettled)).toBool();
    for (const QJsonValue plugin : object.value(word(kPlugins)).toArray())
        probe.plugins.push_back(pluginOf(plugin.toObject()));
    return probe;
}

} // namespace

const char *statusText(ProbeStatus status) { return kStatusTexts[static_cast<std::size_t>(status)]; }

std::optional<ProbeStatus> statusOfText(const QString &text)
{
    const auto found = std::find_if(std::begin(kStatusTexts), std::end(kStatusTexts),
                                    [&](const char *each) { return text == word(each); });
    if (found == std::end(kStatusTexts))
        return std::nullopt;
    return static_cast<ProbeStatus>(std::distance(std::begin(kStatusTexts), found));
}

const char *stageText(ProbeStage stage) { return kStages[static_cast<std::size_t>(stage)]; }

bool RememberedProbe::isCopy() const
{
    return !plugins.empty() &&
           std::none_of(plugins.begin(), plugins.end(),
                        [](const RememberedPlugin &plugin) { return plugin.heldBy.isEmpty(); });
}

bool RememberedProbe::hasPluginsOf(const QString &holder) const
{
    return std::any_of(plugins.begin(), plugins.end(),
                       [&](const RememberedPlugin &plugin) { return isSamePath(plugin.heldBy, holder); });
}

QString RememberedProbe::reasonOf(quint32 subId) const
{
    for (const RememberedPlugin &plugin : plugins)
        if (subId != 0 && plugin.subId == subId && !plugin.reason.isEmpty())
            return plugin.reason;
    return reason;
}

const QStringList &RememberedProbe::framesOf(quint32 subId) const
{
    for (const RememberedPlugin &plugin : plugins)
        if (subId != 0 && plugin.subId == subId && !plugin.frames.isEmpty())
            return plugin.frames;
    return frames;
}

ProbeMemory::ProbeMemory(const QString &effectsFolder)
    : m_file(effectsFolder + QLatin1String(kProbeMemoryFile))
{}

std::map<ProbeMemory::Key, ProbeMemory::Entry> &ProbeMemory::entries() const
{
    if (!m_entries)
        m_entries = readEntries(); // all, or none: what is written later leaves nothing out
    return *m_entries;
}

std::map<ProbeMemory::Key, ProbeMemory::Entry> ProbeMemory::readEntries() const
{
    std::map<Key, Entry> entries;
    QByteArray content;
    if (!readWholeFile(m_file, content))
        return entries;
    const QJsonObject root = QJsonDocument::fromJson(content).object();
    if (root.value(word(kVersion)).toInt() != kThisVersion)
        return entries;
    for (const QJsonValue value : root.value(word(kProbes)).toArray()) {
        const RememberedProbe probe = probeOf(value.toObject());
        if (probe.format != PluginFormat::Unknown && !probe.path.isEmpty())
            entries[{probe.format, pathKey(probe.path)}] = {probe, {}};
    }
    return entries;
}

const RememberedProbe *ProbeMemory::find(PluginFormat format, const QString &path) const
{
    const auto found = entries().find({format, pathKey(path)});
    return found == entries().end() ? nullptr : &found->second.probe;
}

void ProbeMemory::forEach(PluginFormat format,
                          const std::function<void(const RememberedProbe &)> &operation) const
{
    for (const auto &[key, entry] : entries())
        if (key.first == format)
            operation(entry.probe);
}

void ProbeMemory::set(const RememberedProbe &probe)
{
    Entry entry{probe, render(probe)};
    Entry &present = entries()[{probe.format, pathKey(probe.path)}];
    if (present.text.isNull() && !present.probe.path.isEmpty())
        present.text = render(present.probe);
    m_changed |= present.text != entry.text;
    present = std::move(entry);
}

void ProbeMemory::setCrash(PluginFormat format, const EffectRecord &plugin, ProbeStatus status,
                           const QString &reason)
{
    RememberedProbe probe;
    if (const RememberedProbe *last = find(format, plugin.path); last && plugin.subId != 0)
        probe = *last; // its siblings' outcomes stay
    probe.format = format;
    probe.path = plugin.path;
    probe.fileTime = plugin.fileTime;
    probe.isUnsettled = true;
    if (plugin.subId == 0) {
        probe.status = status;
        probe.reason = reason;
        probe.frames.clear();
        probe.plugins = listed(format, plugin.path);
    } else {
        const auto isIt = [&](const RememberedPlugin &each) { return each.subId == plugin.subId; };
        probe.plugins.erase(std::remove_if(probe.plugins.begin(), probe.plugins.end(), isIt),
                            probe.plugins.end());
        probe.plugins.push_back({QString(), plugin.subId, reason, -1, -1, QString()});
    }
    set(probe);
}

std::vector<RememberedPlugin> ProbeMemory::listed(PluginFormat format, const QString &path) const
{
    std::vector<RememberedPlugin> plugins;
    if (const RememberedProbe *last = find(format, path))
        for (const RememberedPlugin &plugin : last->plugins)
            if (!plugin.id.isEmpty())
                plugins.push_back({plugin.id, plugin.subId, QString(), -1, -1, plugin.heldBy, plugin.name});
    return plugins;
}

void ProbeMemory::addCrash(PluginFormat format, const EffectRecord &marker)
{
    const RememberedProbe *last = find(format, marker.path);
    const bool isKnown =
        last && last->fileTime == marker.fileTime &&
        (marker.subId == 0 ? isCrash(last->status) : last->reasonOf(marker.subId) != last->reason);
    if (!isKnown)
        return setCrash(format, marker, ProbeStatus::Crashed, QStringLiteral("it ended the scanner"));
    RememberedProbe known = *last;
    known.isUnsettled = true;
    set(known);
}

bool ProbeMemory::hasUnsettled(PluginFormat format) const
{
    QByteArray content;
    if (!m_entries && !(readWholeFile(m_file, content) && content.contains(kUnsettled)))
        return false;
    return std::any_of(entries().begin(), entries().end(), [&](const auto &each) {
        return each.first.first == format && each.second.probe.isUnsettled;
    });
}

void ProbeMemory::settle(PluginFormat format)
{
    std::vector<RememberedProbe> settled;
    forEach(format, [&](const RememberedProbe &probe) {
        if (probe.isUnsettled)
            settled.push_back(probe);
    });
    for (RememberedProbe &probe : settled) {
        probe.isUnsettled = false;
        set(probe);
    }
}

void ProbeMemory::keepOnly(PluginFormat format, const std::function<bool(const QString &path)> &isKept)
{
    for (auto entry = entries().begin(); entry != entries().end();) {
        const bool stays = entry->first.first != format || isKept(entry->second.probe.path);
        m_changed |= !stays;
        entry = stays ? std::next(entry) : entries().erase(entry);
    }
}

FileResult ProbeMemory::write()
{
    if (!m_changed)
        return {};
    QByteArray text = QByteArray("{\"version\":") + QByteArray::number(kThisVersion) + ",\"probes\":[";
    const char *separator = "\n";
    for (auto &each : entries()) {
        Entry &entry = each.second;
        if (entry.text.isNull())
            entry.text = render(entry.probe);
        text += separator;
        text += entry.text;
        separator = ",\n";
    }
    text += "\n]}\n";
    const FileResult written = replaceFile(m_file, text, Durability::Buffered);
    m_changed = !written;
    return written;
}
