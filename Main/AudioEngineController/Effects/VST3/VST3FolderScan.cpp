#include "Main/AudioEngineController/Effects/VST3/VST3FolderScan.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Host/ProbeBracket.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/VST3/VST3ModuleFile.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Probe.h"
#include "Main/VLib/SimpleGUI.h"

#include <algorithm>

namespace {

/// From this many records of a file, or files of a scan, on the user interface hears of them once in advance.
constexpr std::size_t kMany = 3;

/// The old record whose marks a new one takes over: its own; where either of them only stands for a file that
/// failed, the one that speaks for the file. Null when there is none.
const EffectRecord *sourceOfMarks(const std::vector<EffectRecord> &known, const EffectRecord &record)
{
    const auto own = std::find_if(known.begin(), known.end(),
                                  [&](const EffectRecord &old) { return old.id == record.id; });
    if (own != known.end())
        return &*own;
    const bool standsForFile = !known.empty() && !(known.front().working && record.working);
    return standsForFile ? &known.front() : nullptr;
}

/// The marks of the user outlive a new probe.
void carryMarks(const std::vector<EffectRecord> &known, EffectRecord &record)
{
    if (const EffectRecord *source = sourceOfMarks(known, record))
        takeMarks(record, *source);
}

/// Whether the record that speaks for a file does not fit it any more.
bool isOutdated(const EffectRecord &first, const QString &fileTime)
{
    return first.enabled && first.fileTime != fileTime;
}

/// Passes on how a probe gets on: to the marker, the report and the user interface.
class ScanObserver : public IProbeObserver {
public:
    explicit ScanObserver(const ProbeBracket &bracket)
        : m_bracket(bracket)
    {}

    void stageEntered(ProbeStage stage) override { ProbeReport::stage(stage); }
    void classBegins(const QString &name) override
    {
        m_bracket.showProgress();
        showScanning(name);
    }
    void classAnnounced() override { notifyUI(MessageCode::kEntryAdded); }
    void childrenFound(std::size_t) override {}
    void childBegins(const EffectRecord &) override {}
    void childEnds(const ProbeOutcome &) override {}
    void childCloses(const EffectRecord &) override {}
    void childClosed() override {}

private:
    const ProbeBracket &m_bracket;
};

} // namespace

VST3FolderScan::VST3FolderScan(AudioPluginHost &host)
    : FolderScan(host, "vst3")
{}

std::vector<ScanItem> VST3FolderScan::arrange(const QStringList &paths)
{
    std::vector<ScanItem> queue;
    for (const QString &path : paths)
        if (VST3ModuleFile::isModule(path))
            decide(path, queue);
    return queue;
}

void VST3FolderScan::decide(const QString &path, std::vector<ScanItem> &queue)
{
    const KnownList::Knowledge known = host().known().lookUp(path);
    if (host().isLeftAlone(path)) {
        if (known.how != KnownAs::Namesake)
            keep(known.records);
        return;
    }
    ScanItem item{path, VST3ModuleFile::fileTime(path), true, {}};
    const bool isSettled = known.how == KnownAs::Own || known.how == KnownAs::Namesake;
    if (!isSettled || isOutdated(*known.records.front(), item.fileTime)) {
        for (const EffectRecord *record : known.records)
            item.knownRecords.push_back(*record);
        queue.push_back(std::move(item));
    } else if (known.how == KnownAs::Own) {
        keep(known.records);
    } else {
        keepLater(known.records);
    }
}

void VST3FolderScan::keepLater(const KnownList::Records &records)
{
    m_keptByName.insert(m_keptByName.end(), records.begin(), records.end());
    for (const EffectRecord *record : records)
        addWaiting(*record);
}

void VST3FolderScan::complete()
{
    for (const EffectRecord *record : m_keptByName)
        if (!wasProbed(record->path)) // else the probe said what is true now
            host().AddEffect(*record);
}

bool VST3FolderScan::process(const ScanItem &item)
{
    EffectRecord file;
    file.path = item.path;
    file.fileTime = item.fileTime;
    showScanning(fileNameOf(item.path).chopped(host().moduleEnding().size()));
    ProbeEntry entry(format(), file);
    const ProbeBracket bracket(host(), processState(), file);
    DebugTrace(L"Probing %ls", item.path);
    ScanObserver observer(bracket);
    const ProbeJob job{PluginFormat::Vst3, item.path, item.fileTime, {}, item.knownRecords.empty()};
    ProbeOutcome outcome = VST3Probe().run(job, observer);
    if (!outcome.reason.isEmpty()) {
        DebugLog(L"%ls: %ls", item.path, outcome.reason);
        ProbeReport::reason(outcome.reason);
    }
    entry.listed(outcome.records.size());
    if (!outcome.records.empty())
        return addRecords(item, outcome.records);
    if (outcome.ifFailed == ProbeOutcome::IfFailed::Record)
        return addFailedRecord(item, file);
    if (outcome.ifFailed == ProbeOutcome::IfFailed::KeepKnown)
        for (const EffectRecord &record : item.knownRecords)
            host().AddEffect(record);
    return false;
}

bool VST3FolderScan::addRecords(const ScanItem &item, std::vector<EffectRecord> &records)
{
    const bool announceFirst = records.size() >= kMany || itemCount() >= kMany;
    if (announceFirst)
        notifyUI(MessageCode::kEntryAdded);
    bool added = false;
    for (EffectRecord &record : records) {
        carryMarks(item.knownRecords, record);
        added |= host().AddEffect(record);
    }
    if (added && !announceFirst)
        notifyUI(MessageCode::kEntryAdded);
    return added;
}

bool VST3FolderScan::addFailedRecord(const ScanItem &item, EffectRecord record)
{
    host().completeFailedRecord(record);
    carryMarks(item.knownRecords, record);
    return host().AddEffect(record);
}
