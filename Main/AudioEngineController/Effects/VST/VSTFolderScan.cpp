#include "Main/AudioEngineController/Effects/VST/VSTFolderScan.h"

#include "Core/BaseLib/Files/FileTime.h"
#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Host/ProbeBracket.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/VST/VSTProbe.h"
#include "Main/VLib/SimpleGUI.h"
#include "Main/VLib/VProgressDisplay.h"

#include <algorithm>
#include <optional>

namespace {

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

/// Whether a record of the outcome stands for a sub-plug-in that was only listed.
bool isLeftOut(const EffectRecord &record) { return !record.enabled; }

/// The sub-plug-ins that killed the scanner in this version of the file; another version gets another chance.
std::set<quint32> deadlyChildren(const ScanItem &item)
{
    std::set<quint32> ids;
    for (const EffectRecord &old : item.knownRecords)
        if (old.subId != 0 && !old.enabled && !old.working && old.fileTime == item.fileTime)
            ids.insert(old.subId);
    return ids;
}

} // namespace

/// Writes markers, report and progress of one probe. What it made for the file stands until it is destroyed.
class VSTFolderScan::Observer final : public IProbeObserver {
public:
    Observer(VSTFolderScan &scan, const ScanItem &item, const ProbeJob &job)
        : m_scan(scan)
        , m_item(item)
        , m_addsAtOnce(job.leftOut.empty())
    {
        m_file.path = item.path;
        m_file.fileTime = item.fileTime;
    }

    void stageEntered(ProbeStage stage) override
    {
        if (!m_entry)
            begin();
        ProbeReport::stage(stage);
    }
    void classBegins(const QString &) override {}
    void classAnnounced() override {}
    void childrenFound(std::size_t count) override
    {
        m_isShell = true;
        if (m_scan.progress())
            m_scan.progress()->setRange(static_cast<int>(count), QStringLiteral("Scanning WaveShell"));
    }
    void childBegins(const EffectRecord &child) override
    {
        showScanning(child.subName);
        m_childEntry.emplace(m_scan.format(), child);
        m_childBracket.emplace(m_scan.host(), m_scan.processState(), child, child.subName);
    }
    void childEnds(const ProbeOutcome &outcome) override
    {
        if (!outcome.reason.isEmpty())
            ProbeReport::reason(outcome.reason);
        if (outcome.status == ProbeStatus::Listed)
            m_childEntry->listed(1);
        if (m_addsAtOnce)
            m_added |= m_scan.addListed(m_item, outcome.records.front());
        m_childBracket.reset();
        m_childEntry.reset();
        m_bracket->showProgress();
        if (m_scan.progress())
            m_scan.progress()->setValue(++m_done);
    }
    void childCloses(const EffectRecord &child) override
    {
        m_closing.emplace(m_scan.host(), m_scan.processState(), child, child.subName);
    }
    void childClosed() override { m_closing.reset(); }

    /// Adds the outcome to the catalogue; true when a record was added.
    bool add(const ProbeOutcome &outcome)
    {
        if (!outcome.reason.isEmpty())
            ProbeReport::reason(outcome.reason);
        if (m_isShell)
            m_scan.showItemProgress();
        if (outcome.status != ProbeStatus::Listed) {
            DebugLog(L"%ls, Didn't manage it", m_item.path);
            if (outcome.status == ProbeStatus::NoPlugin)
                m_entry->isNoPlugin();
            return outcome.status == ProbeStatus::Failed && m_scan.addFailed(m_item, m_file);
        }
        if (!m_isShell)
            m_entry->listed(1);
        if (!m_isShell || !m_addsAtOnce) // else the records are where they belong in the order of the names
            for (const EffectRecord &record : outcome.records)
                m_added |= m_scan.addListed(m_item, record);
        return m_added;
    }
    /// Whether the module was to be loaded.
    bool hasBegun() const { return m_entry.has_value(); }

private:
    void begin()
    {
        showScanning(fileNameOf(m_item.path));
        m_entry.emplace(m_scan.format(), m_file);
        m_bracket.emplace(m_scan.host(), m_scan.processState(), m_file);
        DebugTrace(L"Probing %ls", m_item.path);
    }

    VSTFolderScan &m_scan;
    const ScanItem &m_item;
    const bool m_addsAtOnce; ///< sub-plug-ins; those that are left out would get behind the others
    EffectRecord m_file;
    bool m_isShell = false;
    bool m_added = false;
    int m_done = 0; ///< sub-plug-ins
    std::optional<ProbeEntry> m_entry;
    std::optional<ProbeBracket> m_bracket; ///< ends before its entry
    std::optional<ProbeEntry> m_childEntry;
    std::optional<ProbeBracket> m_childBracket;
    std::optional<ProbeBracket> m_closing;
};

VSTFolderScan::VSTFolderScan(VSTHost &host)
    : FolderScan(host, "vst2")
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
    ProbeJob job;
    job.format = PluginFormat::Vst2;
    job.path = item.path;
    job.fileTime = item.fileTime;
    job.leftOut = deadlyChildren(item);
    Observer observer(*this, item, job);
    const ProbeOutcome outcome = VSTProbe().run(job, observer);
    if (observer.hasBegun())
        return observer.add(outcome);
    DebugTrace(L"%ls exports no VST 2 entry point", item.path);
    ProbeReport::instance().skipped(format(), item.path, outcome.reason);
    return false;
}

bool VSTFolderScan::addListed(const ScanItem &item, const EffectRecord &record)
{
    if (isLeftOut(record))
        return host().AddEffect(*ownRecord(item, record));
    return record.working ? addProbed(item, record) : addFailed(item, record);
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
