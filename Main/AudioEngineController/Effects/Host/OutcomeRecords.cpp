#include "Main/AudioEngineController/Effects/Host/OutcomeRecords.h"

#include <algorithm>

namespace {

/// What a file that fails keeps of a record: the marks. It is not working, and asked again when the file
/// changes, also where it crashed elsewhere; what the user switched off stays as it is.
EffectRecord keptBesideFailure(const EffectRecord &old, const EffectRecord &file)
{
    EffectRecord kept = old;
    kept.path = file.path;
    if (!old.isSwitchedOff()) {
        if (!file.fileTime.isEmpty()) { // else the file comes back as it was, with what crashed in it
            kept.fileTime = file.fileTime;
            kept.enabled = true;
        }
        kept.working = false;
    } else if (kept.fileTime.isEmpty()) {
        kept.fileTime = file.fileTime; // it was to be asked again, and has been
    }
    return kept;
}

/// Makes the records of one outcome.
class Maker {
public:
    Maker(const CatalogueHost &host, const ScanPlan &plan, const ScanItem &item)
        : m_host(host)
        , m_plan(plan)
        , m_item(item)
        , m_deadly(plan.deadly(item))
    {}

    void addListed(const std::vector<EffectRecord> &listed)
    {
        for (const EffectRecord &record : listed)
            add(record, listed.size() == 1);
    }
    void addFailed(const QString &fileTime);
    /// `children`: the sub-plug-ins that ended processes of their own before.
    void addCrashed(const std::vector<EffectRecord> &children);
    void keepUnchanged();

    OutcomeRecords made;

private:
    void add(EffectRecord record, bool isOnly);
    void addDeadly(const EffectRecord &child, EffectRecord deadly, bool isOnly);
    void keepBeside(const EffectRecord &kept);
    const EffectRecord *deadlyRecord(const EffectRecord &child) const;
    EffectRecord crashedChild(const EffectRecord &child);
    KnownList knownOfFile() const;
    void applyCrash(KnownList &known, const EffectRecord &marker);
    EffectRecord file(const QString &fileTime) const;

    const CatalogueHost &m_host;
    const ScanPlan &m_plan;
    const ScanItem &m_item;
    const KnownList::Records m_deadly;
};

/// What is known of a sub-plug-in that must not be loaded; null when it may be.
const EffectRecord *Maker::deadlyRecord(const EffectRecord &child) const
{
    for (const EffectRecord *old : m_deadly)
        if (old->subId == child.subId)
            return old;
    return nullptr;
}

/// What the next run would read of the file: no catalogue holds what another file came to list.
KnownList Maker::knownOfFile() const
{
    KnownList known(m_host.known().identity());
    for (const EffectRecord *old : m_item.known) {
        const std::optional<EffectRecord> listed = m_host.findEffect(old->id);
        if (!listed || isSamePath(listed->path, old->path))
            known.addRecord(*old);
    }
    return known;
}

void Maker::applyCrash(KnownList &known, const EffectRecord &marker)
{
    made.crashes.push_back(marker);
    const EffectRecord &crashed = known.applyCrash(marker);
    known.setIdentifier(crashed, m_host.freeIdentifier(crashed, marker.name));
}

/// What a crash marker says of a sub-plug-in.
EffectRecord markerOf(const EffectRecord &child)
{
    EffectRecord marker;
    marker.path = child.path;
    marker.fileTime = child.fileTime;
    marker.name = marker.subName = child.subName;
    marker.subId = child.subId;
    marker.enabled = false;
    return marker;
}

EffectRecord Maker::crashedChild(const EffectRecord &child)
{
    KnownList known = knownOfFile();
    applyCrash(known, markerOf(child));
    const auto &records = known.inOrder();
    return *std::find_if(records.begin(), records.end(),
                         [&](const EffectRecord &record) { return record.subId == child.subId; });
}

EffectRecord Maker::file(const QString &fileTime) const
{
    EffectRecord file;
    file.path = m_item.path;
    file.fileTime = fileTime;
    return file;
}

/// A sub-plug-in that was left out because it ended the process that probed it; another version of the file
/// gets another chance.
void Maker::addDeadly(const EffectRecord &child, EffectRecord deadly, bool isOnly)
{
    deadly.path = m_item.path;
    if (const EffectRecord *source = m_plan.marks().sourceOf(m_item, child, isOnly)) {
        deadly.category = source->category;
        deadly.favourite = source->favourite;
    }
    made.listed.push_back(deadly);
}

void Maker::add(EffectRecord record, bool isOnly)
{
    if (const EffectRecord *old = deadlyRecord(record))
        return addDeadly(record, *old, isOnly);
    if (!record.enabled)
        return addDeadly(record, crashedChild(record), isOnly);
    if (!record.working)
        m_host.completeFailedRecord(record);
    const EffectRecord *source = m_plan.marks().sourceOf(m_item, record, isOnly);
    const EffectRecord *likely = source ? nullptr : m_plan.marks().likelySourceOf(m_item, record);
    if (likely && record.working)
        made.likelyMarks.push_back({record.id, likely});
    else if (source || likely)
        takeMarks(record, source ? *source : *likely);
    made.listed.push_back(record);
}

/// One record stands for the file; what was known of it stays beside it, with its marks.
void Maker::addFailed(const QString &fileTime)
{
    EffectRecord failed = file(fileTime);
    failed.working = false;
    add(failed, false);
    m_host.completeFailedRecord(failed);
    for (const KnownList::Records &records : {m_item.known, m_item.moved})
        for (const EffectRecord *old : records)
            if (!m_host.known().isSameOfFile(*old, failed) && !old->standsForFile()) {
                EffectRecord kept = keptBesideFailure(*old, failed);
                kept.enabled |= records.front()->isCrashedFile() && !old->isSwitchedOff();
                keepBeside(kept);
            }
}

/// Keeps a record beside that of the file. Where the file has one of the same plug-in already, from before
/// what was known of it moved here, only the marks.
void Maker::keepBeside(const EffectRecord &kept)
{
    for (std::vector<EffectRecord> *records : {&made.listed, &made.kept})
        for (EffectRecord &present : *records)
            if (m_host.known().isSameOfFile(present, kept)) {
                if (kept.category != 0)
                    present.category = kept.category;
                present.favourite |= kept.favourite;
                return;
            }
    made.kept.push_back(kept);
}

/// As a crash marker has it that the next run finds.
void Maker::addCrashed(const std::vector<EffectRecord> &children)
{
    EffectRecord marker = file(m_item.fileTime);
    marker.enabled = false;
    NameFromPath(marker);
    if (m_host.isMarkerWithoutRecord(marker))
        return keepUnchanged();
    KnownList known = knownOfFile();
    for (const EffectRecord &child : children)
        applyCrash(known, markerOf(child));
    applyCrash(known, marker);
    // The record for the file, and what it had besides, which gives way to another file that lists it.
    const KnownList::Records records = known.recordsOfPath(m_item.path);
    for (const EffectRecord *record : records)
        (record == records.front() || record->working ? made.listed : made.kept).push_back(*record);
}

/// Keeps what is known of a file that is asked again next time.
void Maker::keepUnchanged()
{
    for (const EffectRecord *record : m_item.known)
        made.kept.push_back(*record);
    for (const EffectRecord *record : m_item.moved) {
        const bool isForFile = record->standsForFile();
        if (isForFile && !record->hasMarks())
            continue;
        made.kept.push_back(ScanPlan::movedUnasked(*record, m_item.path));
        if (isForFile)
            made.kept.back().id = m_host.freeIdentifier(made.kept.back(), record->name);
    }
}

} // namespace

bool OutcomeRecords::holds(const QString &id) const
{
    const auto hasId = [&](const EffectRecord &record) { return record.id == id; };
    return std::any_of(listed.begin(), listed.end(), hasId) || std::any_of(kept.begin(), kept.end(), hasId);
}

OutcomeRecords recordsOfOutcome(const CatalogueHost &host, const ScanPlan &plan, const ScanItem &item,
                                const ProbeOutcome &outcome)
{
    using IfFailed = ProbeOutcome::IfFailed;
    Maker maker(host, plan, item);
    switch (outcome.status) {
    case ProbeStatus::Listed:
        maker.addListed(outcome.records);
        break;
    case ProbeStatus::Failed:
        if (outcome.ifFailed == IfFailed::KeepKnown)
            maker.keepUnchanged();
        else
            maker.addFailed(outcome.ifFailed == IfFailed::LookAgain ? QString() : item.fileTime);
        break;
    case ProbeStatus::Crashed:
    case ProbeStatus::NoAnswer:
        maker.addCrashed(outcome.records);
        break;
    case ProbeStatus::Skipped:
        maker.keepUnchanged();
        break;
    case ProbeStatus::NoPlugin:
    case ProbeStatus::Cancelled:
        break;
    }
    return maker.made;
}
