#include "Main/AudioEngineController/Effects/Host/FolderScan.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Host/OutcomeRecords.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanControl.h"
#include "Main/VLib/SimpleGUI.h"
#include "Main/VLib/VProgressDisplay.h"

#include <QHash>

#include <algorithm>
#include <exception>

namespace {

/// From this many records of a file, or files of a scan, on the user interface hears of them once in advance.
constexpr std::size_t kMany = 3;

/// A plug-in's texts as a catalogue takes them, whose lines they must not break.
void replaceControls(EffectRecord &record)
{
    for (QString *text :
         {&record.name, &record.id, &record.vendor, &record.version, &record.categories, &record.subName})
        for (QChar &character : *text)
            if (character < QLatin1Char(' ') ||
                character >= QChar(0xFFFE)) // no XML reader takes the last two
                character = QLatin1Char(' ');
}

} // namespace

FolderScan::FolderScan(CatalogueHost &host)
    : m_host(host)
    , m_finder(host.fileFinder() ? host.fileFinder()
                                 : std::make_shared<FileFinder>(QStringList(host.info().moduleEnding)))
    , m_memory(host)
{
    if (!host.fileFinder())
        m_finder->setArea({{}, host.rules().excluded});
}

FolderScan::~FolderScan() = default;

void FolderScan::prepare()
{
    if (guard([this] { plan(); }))
        return;
    // A catalogue that is written by a part of a plan loses what that part leaves out.
    m_pooled.reset();
    m_plan.reset();
    guard([this] { m_host.refillEffects(); });
}

bool FolderScan::run()
{
    guard([this] { scan(); });
    return m_written;
}

/// False when the step ended early.
bool FolderScan::guard(const std::function<void()> &step) const
{
    try {
        step();
        return true;
    } catch (const std::exception &error) {
        endEarly(error.what());
    } catch (...) {
        endEarly("an unknown exception");
    }
    return false;
}

/// What the catalogue holds stays: what came of the scan so far leaves out the rest.
void FolderScan::endEarly(const char *why) const
{
    try {
        DebugLog(L"The scan ended early: %s", why);
        ProbeReport::instance().unwritten(m_host.cataloguePath(),
                                          QStringLiteral("the scan ended early: ") + QString::fromUtf8(why));
    } catch (...) {
        return; // there is no memory to say so
    }
}

void FolderScan::plan()
{
    m_host.clearEffects();
    if (m_host.isCatalogueUnread()) {
        m_written |=
            m_host.WriteCatalogue(); // says why it cannot: nothing would come of the probes, and known
        return;                      // crashes would happen again
    }
    if (!m_host.rules()) { // nobody knows what must not be loaded
        ProbeReport::instance().unreadList(m_host.catalogueFolder() + QLatin1String(kFolderRulesFile),
                                           m_host.rules().reason);
        m_host.refillEffects();
        return;
    }
    m_progress = createProgressDisplay();
    const QStringList modules = findModules();
    if (isCancelled()) { // the catalogue holds all that is known
        ProbeReport::instance().cancelled();
        m_host.refillEffects();
        return;
    }
    for (const QString &path : modules)
        m_found.insert(pathKey(path));
    auto plan = std::make_unique<ScanPlan>(m_host, m_memory.probes(), *m_finder);
    plan->decide(modules);
    m_plan = std::move(plan);
    ProbeReport::instance().plan(m_host.format(), static_cast<std::size_t>(modules.size()),
                                 m_plan->items().size());
    addKept();
    if (!m_plan->items().empty() && m_host.probePool())
        makePool();
}

void FolderScan::scan()
{
    if (m_plan) // else there is nothing to be scanned
        finish(m_pooled ? probeInPool() : probeHere());
}

bool FolderScan::isCancelled() const
{
    return m_host.isCancelled() || (m_progress && m_progress->isCancelled());
}

QStringList FolderScan::findModules() const
{
    QStringList paths =
        m_finder->find(m_host.folders(), m_host.info().moduleEnding, [this] { return isCancelled(); });
    for (const FileFinder::Problem &problem : m_finder->takeProblems())
        ProbeReport::instance().unsearched(problem.path, problem.reason);
    const auto isPart = [this](const QString &path) { return !m_host.isModule(path); };
    paths.erase(std::remove_if(paths.begin(), paths.end(), isPart), paths.end());
    if (m_finder->hasOtherPaths())
        keepKnownPaths(paths);
    if (m_host.probesInPathOrder())
        std::sort(paths.begin(), paths.end());
    return paths;
}

/// A file to which several paths lead stays under the one by which it is known.
void FolderScan::keepKnownPaths(QStringList &paths) const
{
    QHash<QString, int> places;
    QSet<QString> names;
    for (int place = 0; place < paths.size(); ++place) {
        places.insert(pathKey(paths.at(place)), place);
        names.insert(pathKey(fileNameOf(paths.at(place))));
    }
    for (const EffectRecord *record : m_host.known().all()) {
        if (places.contains(pathKey(record->path)) ||
            (m_finder->area().isLimited() && !names.contains(pathKey(fileNameOf(record->path)))))
            continue; // a limited search asks the system, which may take its time elsewhere
        const auto found = places.constFind(pathKey(m_finder->foundInsteadOf(record->path)));
        if (found != places.constEnd() && m_host.known().recordsOfPath(paths.at(*found)).empty())
            paths[*found] = record->path;
    }
}

void FolderScan::addKept()
{
    for (const EffectRecord *record : m_plan->kept())
        if (record->working || record->standsForFile())
            m_host.AddEffect(*record);
        else
            m_later.push_back(*record); // a file that lists the same and works goes first
}

ProbeOutcome FolderScan::readable(const ScanItem &item, ProbeOutcome outcome)
{
    outcome.reason.remove(item.path + QLatin1String(": ")); // the path stands beside it
    std::for_each(outcome.records.begin(), outcome.records.end(), replaceControls);
    return outcome;
}

ProbeJob FolderScan::jobOf(const ScanItem &item) const
{
    ProbeJob job;
    job.format = m_host.format();
    job.path = item.path;
    job.fileTime = item.fileTime;
    job.announceClasses = item.known.empty() && item.moved.empty();
    for (const EffectRecord *old : m_plan->deadly(item))
        job.leftOut.insert(old->subId);
    return job;
}

void FolderScan::beginItem(const ScanItem &item)
{
    m_file = EffectRecord();
    m_file.path = item.path;
    m_file.fileTime = item.fileTime;
    m_memory.begin();
    m_isTouched = false;
}

void FolderScan::log(const ScanItem &item, const ProbeOutcome &outcome, int worker) const
{
    if (!outcome.reason.isEmpty())
        DebugLog(L"%ls: %ls", item.path, outcome.reason);
    ProbeReport &report = ProbeReport::instance();
    if (!m_isTouched && outcome.status == ProbeStatus::NoPlugin) {
        report.skipped(m_host.format(), item.path, outcome.reason);
        return;
    }
    if (!m_isTouched)
        report.begin(m_host.format(), m_file, worker);
    report.end(m_host.format(), m_file, outcome, worker);
}

/// True when there is something to be written before the end.
bool FolderScan::keepOutcome(const ScanItem &item, const ProbeOutcome &outcome)
{
    removeWaiting(item, m_waiting);
    OutcomeRecords records = recordsOfOutcome(m_host, *m_plan, item, outcome);
    bool added = outcome.status == ProbeStatus::Listed ? addListed(records.listed) : false;
    if (outcome.status != ProbeStatus::Listed) // what was only looked at can wait for the last write
        for (const EffectRecord &record : records.listed)
            added |= add(record) && m_isTouched;
    giveUpOthers(item, records);
    for (const EffectRecord &record : droppedOf(item, records)) {
        m_dropped.push_back(record);
        if (m_hasCollected)
            m_waiting.insert({record.id, ListedEffect(record)});
    }
    for (EffectRecord &record : records.kept)
        addLater(std::move(record));
    for (const EffectRecord &marker : records.crashes)
        m_host.applyCrash(marker);
    for (const auto &likely : records.likelyMarks) {
        m_likelyMarks.push_back(likely);
        m_host.setHidden(likely.first, true);
    }
    if (!records.likelyMarks.empty()) // else its other records would speak for the file if this process ends
        for (const EffectRecord &record : records.listed)
            if (record.enabled || record.working) // what crashed is not asked
                m_host.setUnsettled(record.id, true);
    m_memory.keep();
    if (!m_hasCollected && added)
        collectWaiting(m_done + 1);
    return added;
}

/// What an item lists no more while another file may yet come to list it: the marks would be lost with this
/// process. Without a time stamp, which has the next scan ask the file again.
std::vector<EffectRecord> FolderScan::droppedOf(const ScanItem &item, const OutcomeRecords &records) const
{
    const auto isReplaced = [&](const EffectRecord &old) {
        return std::any_of(records.listed.begin(), records.listed.end(), [&](const EffectRecord &listed) {
            return m_host.known().isSameOfFile(old, listed);
        });
    };
    std::vector<EffectRecord> dropped;
    for (const EffectRecord *old : item.known)
        if (!records.holds(old->id) &&
            (isReplaced(*old) || old->standsForFile() ? mayYetBeListed(*old) : isAnyOpenBeside(item.path))) {
            dropped.push_back(*old);
            dropped.back().fileTime.clear();
        }
    return dropped;
}

/// What was known of an item and is not kept gives its identifier up, as if it had been read without it.
void FolderScan::giveUpOthers(const ScanItem &item, const OutcomeRecords &records)
{
    for (const EffectRecord *old : item.known)
        if (!records.holds(old->id))
            m_host.giveUp(old->id);
}

/// Of several waiting records of one identifier the first is written: what came of a probe goes before what
/// was known.
void FolderScan::insertFirst(const EffectRecord &record)
{
    m_waiting.insert(m_waiting.lower_bound(record.id), {record.id, ListedEffect(record)});
}

void FolderScan::takeOut(const EffectRecord &record, WaitingRecords &waiting)
{
    const auto [first, last] = waiting.equal_range(record.id);
    const auto entry =
        std::find_if(first, last, [&](const auto &each) { return each.second.record.isSamePlugin(record); });
    if (entry != last)
        waiting.erase(entry);
}

/// Takes out what was known of an item, when it has been dealt with.
void FolderScan::removeWaiting(const ScanItem &item, WaitingRecords &waiting)
{
    for (const EffectRecord *record : item.known)
        takeOut(*record, waiting);
}

bool FolderScan::addListed(const std::vector<EffectRecord> &records)
{
    const bool announcesEach = m_host.announcesEachRecord();
    const bool announcesFirst =
        !announcesEach && (records.size() >= kMany || m_plan->items().size() >= kMany);
    if (announcesFirst)
        notifyUI(MessageCode::kEntryAdded);
    bool added = false;
    for (const EffectRecord &record : records) {
        const bool isAdded = add(record);
        added |= isAdded;
        if (isAdded && announcesEach)
            notifyUI(MessageCode::kEntryAdded);
    }
    if (added && !announcesFirst && !announcesEach)
        notifyUI(MessageCode::kEntryAdded);
    return added;
}

/// Adds a record. Where two files offer one identifier, the memory of the one that loses it says who holds
/// it: its file is not loaded again for that.
bool FolderScan::add(const EffectRecord &record)
{
    const std::optional<EffectRecord> holder = m_host.findEffect(record.id);
    const bool isAdded = m_host.AddEffect(record);
    for (const EffectRecord &later : m_later) // now, as another plug-in may end this process
        if (isAdded && later.id == record.id)
            passMarksToHolder(later);
    if (!holder || isSamePath(holder->path, record.path))
        return isAdded;
    if (isAdded) // the holder has an older version, which this one replaces
        m_memory.setHolder(holder->path, record.id, record.path);
    else
        m_memory.setHolder(record.id, holder->path);
    return isAdded;
}

/// A file that lists the same plug-in goes before one that does not list it any more.
void FolderScan::addLater(EffectRecord record)
{
    insertFirst(record);
    passMarksToHolder(record);
    m_later.push_back(std::move(record));
}

void FolderScan::collectWaiting(std::size_t from)
{
    m_hasCollected = true;
    std::set<QString, PathLess> settled;
    const std::vector<ScanItem> &items = m_plan->items();
    // Not of files that are gone: another than the one that they were given to may list them.
    for (std::size_t index = 0; index < items.size(); ++index)
        if (index < from || isSettled(index))
            settled.insert(items[index].path);
    for (const EffectRecord *record : m_host.known().all())
        if (!m_host.isListed(record->id) && settled.count(record->path) == 0)
            m_waiting.insert({record->id, ListedEffect(*record)});
    for (const EffectRecord &record : m_dropped)
        if (!m_host.isListed(record.id) && isAnyOpenBeside(record.path))
            m_waiting.insert({record.id, ListedEffect(record)});
}

bool FolderScan::writeInterim()
{
    const bool isWritten = m_host.writeInterim(m_waiting, Durability::Buffered);
    m_written |= isWritten;
    return isWritten;
}

/// Whether another file, which is still to be asked or which a cancelled scan did not reach, may be the one
/// in which the plug-in was.
bool FolderScan::mayYetBeListed(const EffectRecord &old) const
{
    const std::vector<ScanItem> &items = m_plan->items();
    if (m_namesakes.isEmpty())
        for (std::size_t index = 0; index < items.size(); ++index)
            m_namesakes[pathKey(fileNameOf(items[index].path))].push_back(index);
    const std::vector<std::size_t> namesakes = m_namesakes.value(pathKey(fileNameOf(old.path)));
    return std::any_of(namesakes.begin(), namesakes.end(), [&](std::size_t index) {
        return !isSettled(index) && !isSamePath(items[index].path, old.path);
    });
}

/// Whether another file is still to be asked, or was not reached by a cancelled scan.
bool FolderScan::isAnyOpenBeside(const QString &path) const
{
    const std::vector<ScanItem> &items = m_plan->items();
    for (std::size_t index = m_done; index < items.size(); ++index)
        if (!isSettled(index) && !isSamePath(items[index].path, path))
            return true;
    return false;
}

void FolderScan::finish(bool isWhole)
{
    m_waiting.clear();
    for (const EffectRecord &record : m_later)
        if (!m_host.AddEffect(record))
            passMarksToHolder(record);
    QSet<const EffectRecord *> replaced;
    QSet<QString> open; // files of which a record stays hidden
    for (const auto &[id, old] : m_likelyMarks) {
        if (mayYetBeListed(*old)) { // the next scan knows
            if (const std::optional<EffectRecord> hidden = m_host.findEffect(id))
                open.insert(pathKey(hidden->path));
            continue;
        }
        if (!m_host.isListed(old->id)) {
            m_host.passMarks(*old, id);
            replaced.insert(old);
        }
        m_host.setHidden(id, false);
    }
    for (const EffectRecord &record : m_likelyMarks.empty() ? std::vector<EffectRecord>() : m_host.effects())
        if (!open.contains(pathKey(record.path)))
            m_host.setUnsettled(record.id, false);
    const auto moved = isWhole ? m_plan->movedToCrashed() : ScanPlan::MovedToCrashed();
    QSet<QString> settled;
    for (const EffectRecord &record : moved.records)
        if (m_host.AddEffect(record))
            settled.insert(pathKey(record.path));
    listIgnored(settled);
    if (isWhole) {
        for (const auto &[id, old] : moved.marks)
            m_host.passMarks(old, id);
        for (const EffectRecord *record : m_plan->away())
            if (!m_host.isListed(record->id)) // else a file that is there lists it
                m_host.AddEffect(*record);
        for (const KnownList::Records &orphans : {m_plan->orphans(), m_plan->orphansOf(skippedFiles())})
            for (const EffectRecord *record : orphans)
                if (!replaced.contains(record))
                    m_host.AddEffect(*record);
        forgetGone();
        m_host.clearSuspects([this](const QString &path) {
            const KnownList::Records &away = m_plan->away();
            return m_plan->isOutside(path) ||
                   std::any_of(away.begin(), away.end(),
                               [&](const EffectRecord *record) { return isSamePath(record->path, path); });
        });
    } else {
        ProbeReport::instance().cancelled();
        collectWaiting(m_done);
    }
    m_written |= m_host.writeIfChanged(m_waiting);
    if (isWhole && !m_finder->area().isLimited() && !m_host.hasFailedToWrite() &&
        (m_plan->hasNewCrashes() || m_host.hasNewCrashes()))
        m_memory.settleCrashes();
    m_memory.write(true);
}

/// What the user passed over in this scan.
QStringList FolderScan::skippedFiles() const
{
    QStringList skipped;
    for (const ScanItem &item : m_plan->items())
        if (ScanControl::instance().isSkipped(item.path))
            skipped.append(item.path);
    return skipped;
}

/// What the user wants never loaded is listed all the same; what nobody ever asked has a record for the file.
void FolderScan::listIgnored(const QSet<QString> &settled)
{
    for (const QString &path : m_plan->ignored()) {
        if (settled.contains(pathKey(path)))
            continue;
        const KnownList::Records known = m_host.known().recordsOfPath(path);
        const RememberedProbe *last = m_memory.probes().find(m_host.format(), path);
        const bool isListed = std::any_of(known.begin(), known.end(), [&](const EffectRecord *record) {
            const std::optional<EffectRecord> listed = m_host.findEffect(record->id);
            return listed && isSamePath(listed->path, path);
        });
        if (isListed || m_host.moduleTime(path).isEmpty() || (last && last->status == ProbeStatus::NoPlugin))
            continue;
        EffectRecord file;
        file.path = path;
        m_host.completeFailedRecord(file);
        settleIgnored(file, true);
        m_host.AddEffect(file);
    }
}

/// A file that came to list what another one lists no more has that one's marks, unless it had its own.
void FolderScan::passMarksToHolder(const EffectRecord &record)
{
    const std::optional<EffectRecord> holder = m_host.findEffect(record.id);
    if (!holder || !holder->working || isSamePath(holder->path, record.path))
        return;
    if (!m_host.known().holds(holder->path, record.id))
        m_host.passMarks(record, record.id);
}

void FolderScan::forgetGone()
{
    if (!m_plan->hasGone() && m_plan->items().empty())
        return; // as it was read
    QSet<QString> there = m_found;
    for (const KnownList::Records *records : {&m_plan->away(), &m_plan->orphans()})
        for (const EffectRecord *record : *records)
            there.insert(pathKey(record->path));
    m_memory.keepOnly(
        [&](const QString &path) { return m_plan->isOutside(path) || there.contains(pathKey(path)); });
}
