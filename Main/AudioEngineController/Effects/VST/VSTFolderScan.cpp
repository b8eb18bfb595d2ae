#include "Main/AudioEngineController/Effects/VST/VSTFolderScan.h"

#include "Core/BaseLib/Binary/BinaryExports.h"
#include "Core/BaseLib/Files/FileTime.h"
#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Host/ProbeBracket.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/VST/VSTHostCallback.h"
#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"
#include "Main/VLib/SimpleGUI.h"
#include "Main/VLib/VProgressDisplay.h"

#include <algorithm>

namespace {

bool hasNoEntryPoint(const QString &path)
{
    return findExports(path, {"VSTPluginMain", "main"}) == ExportAnswer::NotExported;
}

/// Whether the record that speaks for a file does not fit it any more.
bool isOutdated(const EffectRecord &first, const QString &fileTime)
{
    if (!first.enabled)
        return first.subId != 0; // all sub-plug-ins of a shell are disabled
    return first.fileTime != fileTime;
}

/// The old record of the same plug-in or sub-plug-in, or null.
const EffectRecord *ownRecord(const ScanItem &item, const EffectRecord &record)
{
    const auto own = std::find_if(item.knownRecords.begin(), item.knownRecords.end(),
                                  [&](const EffectRecord &old) { return old.subId == record.subId; });
    return own == item.knownRecords.end() ? nullptr : &*own;
}

/// The marks of the user outlive a new probe: a sub-plug-in takes them from its own old record, else from the
/// one that speaks for the file.
void carryMarks(const ScanItem &item, EffectRecord &record)
{
    const EffectRecord *source = ownRecord(item, record);
    if (!source && !item.knownRecords.empty() && item.knownRecords.front().enabled)
        source = &item.knownRecords.front();
    if (source)
        takeMarks(record, *source);
}

} // namespace

VSTFolderScan::VSTFolderScan(VSTHost &host)
    : FolderScan(host, "vst2")
    , m_vstHost(host)
{}

std::vector<ScanItem> VSTFolderScan::arrange(const QStringList &paths)
{
    QStringList sorted = paths;
    std::sort(sorted.begin(), sorted.end());
    std::vector<ScanItem> items;
    items.reserve(static_cast<std::size_t>(sorted.size()));
    for (const QString &path : sorted) {
        const QString fileTime = regularFileTimeText(path);
        if (fileTime.isEmpty()) { // a folder of that name; or a pipe, which would be waited for
            if (cannotBeExamined(path))
                keep(host().known().recordsOfPath(path));
            continue;
        }
        const KnownList::Knowledge known = host().known().lookUp(path);
        ScanItem item{path, fileTime, true, {}};
        item.probe = known.how != KnownAs::Own || isOutdated(*known.records.front(), item.fileTime);
        if (known.how != KnownAs::Namesake) // files of one name are told apart by their paths
            for (const EffectRecord *record : known.records)
                item.knownRecords.push_back(*record);
        items.push_back(std::move(item));
    }
    return items;
}

bool VSTFolderScan::process(const ScanItem &item)
{
    if (item.probe)
        return probe(item);
    for (const EffectRecord &record : item.knownRecords)
        host().AddEffect(record);
    return false;
}

bool VSTFolderScan::probe(const ScanItem &item)
{
    if (hasNoEntryPoint(item.path)) {
        DebugTrace(L"%ls exports no VST 2 entry point", item.path);
        ProbeReport::instance().skipped(format(), item.path,
                                        QStringLiteral("it exports no VST 2 entry point"));
        return false;
    }
    EffectRecord file;
    file.path = item.path;
    file.fileTime = item.fileTime;
    showScanning(fileNameOf(item.path));
    ProbeEntry entry(format(), file);
    const ProbeBracket bracket(host(), processState(), file);
    DebugTrace(L"Probing %ls", item.path);
    std::vector<EffectRecord> children; // outlive the plug-in, whose end still closes them
    VSTPlugin plugin(m_vstHost);        // unloads its module before the bracket deletes the marker
    plugin.setCloseBracket([&](VstInt32 shellId) { return bracketOfChild(children, shellId); });
    bool isPluginModule = true;
    if (!plugin.load(item.path, VSTHostCallback, isPluginModule)) {
        DebugLog(L"%ls, Didn't manage it", item.path);
        if (!isPluginModule)
            entry.isNoPlugin();
        return isPluginModule && addFailed(item, file);
    }
    plugin.readInto(file);
    if (file.vstCategory != kPlugCategShell) {
        entry.listed(1);
        return addProbed(item, file);
    }
    for (const VSTSubPlugin &sub : plugin.subPlugins()) {
        children.push_back(file);
        children.back().name = children.back().subName = sub.name;
        children.back().subId = sub.id;
    }
    if (children.empty())
        ProbeReport::reason(QStringLiteral("it is a shell and lists no sub-plug-in"));
    return children.empty() ? addFailed(item, file) : expandShell(item, plugin, children, bracket);
}

std::shared_ptr<ProbeBracket> VSTFolderScan::bracketOfChild(const std::vector<EffectRecord> &children,
                                                            VstInt32 shellId)
{
    for (const EffectRecord &child : children)
        if (child.subId == static_cast<quint32>(shellId))
            return std::make_shared<ProbeBracket>(host(), processState(), child, child.subName);
    return nullptr;
}

bool VSTFolderScan::addProbed(const ScanItem &item, EffectRecord record)
{
    carryMarks(item, record);
    const bool added = host().AddEffect(record);
    if (added)
        notifyUI(MessageCode::kEntryAdded);
    return added;
}

bool VSTFolderScan::addFailed(const ScanItem &item, EffectRecord record)
{
    host().completeFailedRecord(record);
    return addProbed(item, record);
}

bool VSTFolderScan::expandShell(const ScanItem &item, VSTPlugin &plugin,
                                const std::vector<EffectRecord> &children, const ProbeBracket &bracket)
{
    if (progress())
        progress()->setRange(static_cast<int>(children.size()), QStringLiteral("Scanning WaveShell"));
    bool added = false;
    int done = 0;
    for (const EffectRecord &child : children) {
        added |= addChild(item, plugin, child);
        bracket.showProgress();
        if (progress())
            progress()->setValue(++done);
    }
    showItemProgress();
    return added;
}

bool VSTFolderScan::addChild(const ScanItem &item, VSTPlugin &plugin, const EffectRecord &child)
{
    const EffectRecord *old = ownRecord(item, child);
    if (old && !old->enabled && !old->working && old->fileTime == child.fileTime)
        return host().AddEffect(
            *old); // it killed the scanner; another version of the file gets another chance
    showScanning(child.subName);
    ProbeEntry entry(format(), child);
    const ProbeBracket bracket(host(), processState(), child, child.subName);
    if (!plugin.load(child, VSTHostCallback, 1))
        return addFailed(item, child);
    entry.listed(1);
    EffectRecord record = child;
    plugin.readInto(record);
    return addProbed(item, record);
}
