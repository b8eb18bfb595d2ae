#include "Main/AudioEngineController/Effects/Host/ScanPlan.h"

#include "Core/BaseLib/Files/AnswerInTime.h"

#include <QDir>
#include <QFileInfo>

#include <algorithm>
#include <functional>
#include <iterator>
#include <utility>

namespace {

/// Whether the record that speaks for a file does not fit it any more, or a scan that asked it was cut off.
bool isOutdated(const KnownList::Records &known, const QString &fileTime)
{
    const EffectRecord &first = *known.front();
    const auto hasNoTime = [](const EffectRecord *record) { return record->fileTime.isEmpty(); };
    if (!first.isCrashedFile() && std::any_of(known.begin(), known.end(), hasNoTime))
        return true;
    if (!first.enabled)
        return first.subId != 0 && // all sub-plug-ins of a shell are disabled
               (!first.isSwitchedOff() || first.fileTime != fileTime);
    return first.fileTime != fileTime;
}

/// How many of the last folders of two paths have the same names: a folder was renamed, or moved as a whole.
int commonEnd(const QString &left, const QString &right)
{
    const QStringList a = left.split(QLatin1Char('/'));
    const QStringList b = right.split(QLatin1Char('/'));
    int common = 0;
    while (common < std::min(a.size(), b.size()) &&
           isSamePath(a.at(a.size() - 1 - common), b.at(b.size() - 1 - common)))
        ++common;
    return common;
}

/// True for a file of which no plug-in is known: nothing is, or only that it failed, or that sub-plug-ins
/// crashed, as a marker may have come before the records of the file that moved there.
bool isHardlyKnown(const KnownList::Records &records)
{
    return std::all_of(records.begin(), records.end(), [](const EffectRecord *record) {
        const bool isCrashedChild = record->subId != 0 && !record->enabled && !record->working;
        return isCrashedChild || (record->standsForFile() && record->enabled);
    });
}

/// True for a sub-plug-in of which nothing but its crash is known.
bool isFromMarker(const EffectRecord *record)
{
    return record->subId != 0 && !record->enabled && !record->working &&
           (record->id == record->subName || record->id.startsWith(record->path));
}

/// Whether a record says something of a plug-in that nobody else knows.
bool hasSomethingToLose(const EffectRecord &record)
{
    return record.hasMarks() || (!record.enabled && !record.working && !record.isIgnored());
}

bool hasCrashed(const KnownList &known)
{
    const auto &records = known.inOrder();
    return std::any_of(records.begin(), records.end(),
                       [](const EffectRecord &record) { return record.isCrashedFile(); });
}

} // namespace

ScanPlan::ScanPlan(const CatalogueHost &host, const ProbeMemory &memory, const FileFinder &finder)
    : m_host(host)
    , m_memory(memory)
    , m_unread(finder.unread())
    , m_area(finder.area())
    , m_marks(host.known())
    , m_hasNewCrashes(host.hasNewCrashes() ||
                      (hasCrashed(host.known()) && memory.hasUnsettled(host.format())))
{
    for (const QString &folder : host.folders())
        if (!folder.isEmpty())
            m_folders.append(QDir::cleanPath(QFileInfo(folder).absoluteFilePath()));
}

/// Whether a file crashed since a scan settled what moved: in this scan, or in one that was cut off.
bool ScanPlan::isNewCrash(const QString &path) const
{
    const RememberedProbe *last = m_memory.find(m_host.format(), path);
    return m_host.hasNewCrash(path) || (last && last->isUnsettled);
}

void ScanPlan::keep(const KnownList::Records &records)
{
    m_kept.insert(m_kept.end(), records.begin(), records.end());
}

void ScanPlan::decide(const QStringList &modules)
{
    QSet<QString> found;
    for (const QString &path : modules) {
        found.insert(pathKey(path));
        decideModule(path);
    }
    sortMissing(found);
    // Else there is nothing to settle, nor what a copy may be of.
    if (!m_items.empty() || !m_gone.empty() || !m_away.empty() || m_hasNewCrashes) {
        indexKept();
        settleAllGone(modules);
        leaveOutCopies();
        askCopiesOfUnsettled();
        collectOrphans();
    }
    std::stable_partition(m_items.begin(), m_items.end(),
                          [](const ScanItem &item) { return !item.known.empty() || !item.moved.empty(); });
    std::stable_partition(m_items.begin(), m_items.end(),
                          [this](const ScanItem &item) { return m_host.isSuspect(item.path); });
    m_marks.addAway(m_away);
    for (const ScanItem &item : m_items)
        for (const KnownList::Records &records : {item.known, item.moved})
            m_marks.addAsked(records);
    for (const KnownFile &gone : m_gone)
        m_marks.addGone(gone.records);
    for (const EffectRecord *record : m_kept)
        if (record->isCrashedFile() && record->hasMarks())
            addCrashedPlugin(*record);
}

/// A record for a file has marks where it was that of its only plug-in.
void ScanPlan::addCrashedPlugin(const EffectRecord &record)
{
    const std::vector<RememberedPlugin> listed = m_memory.listed(m_host.format(), record.path);
    if (listed.size() == 1 && listed.front().subId == 0)
        m_marks.addCrashed(&record, listed.front().id);
}

void ScanPlan::decideModule(const QString &path)
{
    KnownList::Records known = m_host.known().recordsOfPath(path);
    if (m_host.rules().isIgnored(path)) {
        m_ignored.append(path);
        keep(known);
        return;
    }
    const QString fileTime = m_host.moduleTime(path);
    const bool isAbsent = fileTime.isEmpty(); // not a module after all; unless nobody lets us see
    if (m_host.isLeftAlone(path) || (isAbsent && (cannotBeExamined(path) || leadsNowhere(path))) ||
        (!isAbsent && !known.empty() && !isOutdated(known, fileTime) && !mayBeForgotten(*known.front())))
        keep(known);
    else if (!isAbsent)
        m_items.push_back({path, fileTime, std::move(known), {}});
}

/// Whether a process that ended knew more of a file than it had time to write down: the memory is not
/// written after each file.
bool ScanPlan::mayBeForgotten(const EffectRecord &first) const
{
    return m_hasNewCrashes && first.enabled && !m_memory.find(m_host.format(), first.path);
}

void ScanPlan::sortMissing(const QSet<QString> &found)
{
    collectSought();
    QSet<QString> gone;
    for (const EffectRecord *record : m_host.known().all()) {
        const QString key = pathKey(record->path);
        if (found.contains(key) || gone.contains(key))
            continue;
        const bool isNamesake = m_sought.contains(pathKey(fileNameOf(record->path)));
        const bool isElsewhere = isOutside(record->path);
        if (isElsewhere && !((isNamesake || m_sought.contains(key)) && isMissing(record->path))) {
            keep({record});
            continue;
        }
        if ((isElsewhere && !isNamesake) || !isGone(record->path)) {
            m_away.push_back(record);
            continue;
        }
        gone.insert(key);
        m_gone.push_back({record->path, m_host.known().recordsOfPath(record->path)});
    }
}

/// Collects the names of files of which hardly anything is known, and the paths of those whose copies they
/// were: a file that lay where this scan does not look may have moved there.
void ScanPlan::collectSought()
{
    if (!m_area.isLimited())
        return;
    for (const QString &path : m_ignored)
        if (m_host.known().recordsOfPath(path).empty())
            m_sought.insert(pathKey(fileNameOf(path)));
    for (const ScanItem &item : m_items) {
        if (!isHardlyKnown(item.known))
            continue;
        m_sought.insert(pathKey(fileNameOf(item.path)));
        if (const RememberedProbe *last = m_memory.find(m_host.format(), item.path))
            for (const RememberedPlugin &plugin : last->plugins)
                m_sought.insert(pathKey(plugin.heldBy));
    }
}

/// Whether a file is not there, wherever it lay. What gives no answer counts as there.
bool ScanPlan::isMissing(const QString &path)
{
    const auto [entry, isNew] = m_isMissing.try_emplace(path, false);
    if (isNew)
        entry->second = fileAnswers(path) && !QFileInfo::exists(path) && !cannotBeExamined(path);
    return entry->second;
}

bool ScanPlan::isGone(const QString &path)
{
    const QString folder = m_host.moduleFolder(path);
    if (isBelowAny(folder, m_unread) || mayMoveOutside(path))
        return false;
    if (m_area.isExcluded(path))
        return true;
    if (leadsNowhere(path) || leadsNowhere(bundleOf(path)))
        return false;
    if (!isBelowAny(path, m_folders)) // one of these may be the module itself
        return true;
    const auto [entry, isNew] = m_isFolderThere.try_emplace(folder, false);
    if (isNew)
        entry->second =
            QFileInfo(folder).isReadable() &&
            !QDir(folder).isEmpty(QDir::AllEntries | QDir::Hidden | QDir::System | QDir::NoDotAndDotDot);
    return entry->second;
}

/// Whether a copy of what a file listed is known where nobody looked: it has yet to take that over.
bool ScanPlan::mayMoveOutside(const QString &path) const
{
    bool hasCopy = false;
    if (m_area.isLimited())
        m_memory.forEach(m_host.format(), [&](const RememberedProbe &last) {
            hasCopy |= isOutside(last.path) && last.hasPluginsOf(path);
        });
    return hasCopy;
}

void ScanPlan::indexKept()
{
    for (const EffectRecord *record : m_kept) {
        m_keptPaths.insert(pathKey(record->path));
        if (record->working)
            m_keptPlugins.insert({pathKey(record->path), record->id});
    }
}

void ScanPlan::settleAllGone(const QStringList &modules)
{
    if (m_gone.empty())
        return;
    // Of several of one name the first one's records move.
    std::stable_partition(m_gone.begin(), m_gone.end(), [](const KnownFile &gone) {
        return std::any_of(gone.records.begin(), gone.records.end(),
                           [](const EffectRecord *record) { return record->hasMarks(); });
    });
    QHash<QString, QStringList> namesakes;
    for (const QString &path : modules)
        namesakes[pathKey(fileNameOf(path))].append(path);
    QMultiHash<QString, std::size_t> unknown;
    for (std::size_t index = 0; index < m_items.size(); ++index)
        if (isHardlyKnown(m_items[index].known))
            unknown.insert(pathKey(fileNameOf(m_items[index].path)), index);
    for (const KnownFile &gone : m_gone) {
        const QString name = pathKey(fileNameOf(gone.path));
        settleGone(gone, unknown.values(name), namesakes.value(name));
    }
}

/// Gives the records of a gone file to one that may be the same: to one of its name of which no plug-in is
/// known, by the place of its item. Else those that are known are asked again, and so is a copy that failed.
void ScanPlan::settleGone(const KnownFile &gone, QList<std::size_t> unknown, const QStringList &namesakes)
{
    std::sort(unknown.begin(), unknown.end());
    ScanItem *best = nullptr;
    auto bestPlace = std::make_pair(false, 0);
    QStringList heirs;
    for (const std::size_t index : unknown) {
        ScanItem &item = m_items[index];
        if (!item.moved.empty())
            continue;
        heirs.append(item.path);
        const auto place = std::make_pair(item.known.empty(), commonEnd(item.path, gone.path));
        if (place > bestPlace) {
            best = &item;
            bestPlace = place;
        }
    }
    const QString leftAlone = best ? QString() : leftAloneOf(namesakes);
    m_settled.push_back({&gone, namesakes, heirs, leftAlone, best || !leftAlone.isEmpty()});
    if (best) {
        best->moved = gone.records;
        return;
    }
    const std::size_t first = m_items.size();
    askAgain(namesakes, SwitchedOff::StayUnasked);
    const auto failed = std::find_if(m_items.begin() + static_cast<std::ptrdiff_t>(first), m_items.end(),
                                     [](const ScanItem &item) { return isHardlyKnown(item.known); });
    if (failed != m_items.end()) {
        failed->moved = gone.records;
        m_settled.back().hasMoved = true;
    }
}

/// A scan of a part does not see where a gone file may have moved to.
void ScanPlan::collectOrphans()
{
    for (const SettledFile &settled : m_area.isLimited() ? m_settled : std::vector<SettledFile>())
        for (const EffectRecord *record : settled.gone->records)
            if (hasSomethingToLose(*record) && !(settled.hasMoved && record->standsForFile()))
                m_orphans.push_back(record);
}

KnownList::Records ScanPlan::orphansOf(const QStringList &unasked) const
{
    KnownList::Records orphans;
    for (const SettledFile &settled : m_settled) {
        const bool mayMove = std::any_of(settled.namesakes.begin(), settled.namesakes.end(),
                                         [&](const QString &path) { return unasked.contains(path); });
        if (!settled.hasMoved && mayMove)
            std::copy_if(settled.gone->records.begin(), settled.gone->records.end(),
                         std::back_inserter(orphans),
                         [](const EffectRecord *record) { return hasSomethingToLose(*record); });
    }
    return orphans;
}

/// The first file of which nothing is known that must not be loaded; empty when there is none.
QString ScanPlan::leftAloneOf(const QStringList &namesakes) const
{
    const auto found = std::find_if(namesakes.begin(), namesakes.end(), [this](const QString &path) {
        return (m_host.isLeftAlone(path) || m_ignored.contains(path)) &&
               m_host.known().recordsOfPath(path).empty();
    });
    return found == namesakes.end() ? QString() : *found;
}

EffectRecord ScanPlan::movedUnasked(const EffectRecord &gone, const QString &path)
{
    EffectRecord moved = gone;
    moved.path = path;
    moved.fileTime.clear(); // what another path's file was, or did, says nothing
    moved.enabled |= !moved.working;
    return moved;
}

/// The same where the user wants nothing loaded.
EffectRecord ScanPlan::movedIgnored(const EffectRecord &gone, const QString &path) const
{
    EffectRecord moved = movedUnasked(gone, path);
    if (gone.standsForFile())
        moved.id = m_host.freeIdentifier(moved, gone.name);
    settleIgnored(moved, true);
    return moved;
}

ScanPlan::MovedToCrashed ScanPlan::movedToCrashed() const
{
    const auto hasCrashed = [this](const QString &path) {
        const KnownList::Records known = m_host.known().recordsOfPath(path);
        return !known.empty() && known.front()->isCrashedFile();
    };
    MovedToCrashed moved;
    for (const SettledFile &settled : m_settled)
        for (const EffectRecord *record : settled.gone->records)
            if (m_ignored.contains(settled.leftAlone))
                moved.records.push_back(movedIgnored(*record, settled.leftAlone));
            else if (!settled.leftAlone.isEmpty() && !record->standsForFile())
                moved.records.push_back(movedUnasked(*record, settled.leftAlone));
    for (const SettledFile &settled : m_settled)
        if (std::all_of(settled.heirs.begin(), settled.heirs.end(), hasCrashed))
            moveToCrashed(*settled.gone, settled.namesakes, moved);
    return moved;
}

void ScanPlan::moveToCrashed(const KnownFile &gone, const QStringList &namesakes, MovedToCrashed &all) const
{
    // What crashed long ago is none that has moved just now, but it may be a copy.
    const auto isHeir = [&](const QString &path) {
        const RememberedProbe *last = m_memory.find(m_host.format(), path);
        return isNewCrash(path) || (last && last->hasPluginsOf(gone.path));
    };
    const auto isOnlyCrashed = [&](const QString &path) {
        const KnownList::Records known = m_host.known().recordsOfPath(path);
        return !known.empty() && known.front()->isCrashedFile() && isHeir(path) &&
               std::all_of(known.begin() + 1, known.end(), isFromMarker);
    };
    const auto crashed = std::find_if(namesakes.begin(), namesakes.end(), isOnlyCrashed);
    if (crashed == namesakes.end())
        return;
    const KnownList::Records present = m_host.known().recordsOfPath(*crashed);
    const EffectRecord &file = *present.front();
    for (const EffectRecord *record : gone.records) {
        const EffectRecord *same = findRecord(
            present, [&](const EffectRecord &each) { return m_host.known().isSameOfFile(*record, each); });
        if (same) {
            if (!same->hasMarks())
                all.marks.try_emplace(same->id, *record).first->second.enabled = true; // it stays disabled
            continue;
        }
        if (record->standsForFile())
            continue;
        all.records.push_back(*record);
        EffectRecord &moved = all.records.back();
        moved.path = file.path;
        if (moved.isSwitchedOff())
            continue;
        moved.fileTime = file.fileTime;
        moved.enabled = moved.working = false;
    }
}

bool ScanPlan::isKept(const QString &path) const { return m_keptPaths.contains(pathKey(path)); }

/// Whether a file that is kept has the record of the identifier, and the plug-in works.
bool ScanPlan::isHeld(const RememberedPlugin &plugin) const
{
    return m_keptPlugins.contains({pathKey(plugin.heldBy), plugin.id});
}

/// Has modules asked again that were to be kept: what a gone file listed may be theirs as well.
void ScanPlan::askAgain(const QStringList &paths, SwitchedOff switchedOff)
{
    for (const QString &path : paths) {
        const KnownList::Records known = m_host.known().recordsOfPath(path);
        const bool isAsked =
            !known.empty() && (known.front()->enabled ||
                               (switchedOff == SwitchedOff::AreAsked && known.front()->isSwitchedOff()));
        if (!isAsked || m_host.isLeftAlone(path) || !isKept(path) || isOutside(path))
            continue;
        m_kept.erase(
            std::remove_if(m_kept.begin(), m_kept.end(),
                           [&](const EffectRecord *record) { return isSamePath(record->path, path); }),
            m_kept.end());
        m_keptPaths.remove(pathKey(path));
        for (const EffectRecord *record : known)
            m_keptPlugins.remove({pathKey(path), record->id});
        m_items.push_back({path, m_host.moduleTime(path), known, {}});
    }
}

/// True for a file of which nothing is catalogued because others hold all that it lists, and still do.
bool ScanPlan::isUnchangedCopy(const ScanItem &item) const
{
    if (!item.known.empty() || !item.moved.empty())
        return false;
    const RememberedProbe *last = m_memory.find(m_host.format(), item.path);
    if (!last || last->fileTime != item.fileTime || !last->isCopy() || isCrash(last->status))
        return false;
    return std::all_of(last->plugins.begin(), last->plugins.end(),
                       [this](const RememberedPlugin &plugin) { return isHeld(plugin); });
}

void ScanPlan::leaveOutCopies()
{
    m_items.erase(std::remove_if(m_items.begin(), m_items.end(),
                                 [this](const ScanItem &item) { return isUnchangedCopy(item); }),
                  m_items.end());
}

/// Has files asked again that list something which another file held that is gone or asked now. Which one
/// that is says the catalogue where the memory does not: a process may have ended between writing the two.
/// What a file lists of which nothing is remembered nobody knows.
void ScanPlan::askCopiesOfUnsettled()
{
    QHash<QString, const EffectRecord *> holders;
    bool isAnyUnsettled = false;
    for (const EffectRecord *record : m_host.known().all()) {
        holders.insert(record->id, record);
        isAnyUnsettled |= !isKept(record->path);
    }
    const auto isElsewhere = [&](const QString &id, const QString &path) {
        const EffectRecord *holder = holders.value(id);
        return holder && !isSamePath(holder->path, path) && !isKept(holder->path);
    };
    QStringList copies;
    for (const EffectRecord *record : isAnyUnsettled ? m_host.known().all() : KnownList::Records())
        if (!m_memory.find(m_host.format(), record->path))
            copies.append(record->path);
    m_memory.forEach(m_host.format(), [&](const RememberedProbe &last) {
        const bool isUnsettled =
            std::any_of(last.plugins.begin(), last.plugins.end(), [&](const RememberedPlugin &plugin) {
                return plugin.heldBy.isEmpty() ? isElsewhere(plugin.id, last.path) : !isHeld(plugin);
            });
        if (isUnsettled)
            copies.append(last.path);
    });
    askAgain(copies, SwitchedOff::AreAsked); // they list more than that
}

KnownList::Records ScanPlan::deadly(const ScanItem &item) const
{
    KnownList::Records deadly;
    for (const KnownList::Records &records : {item.known, item.moved})
        if (!records.empty() && !records.front()->isCrashedFile())
            std::copy_if(records.begin(), records.end(), std::back_inserter(deadly),
                         [&](const EffectRecord *old) {
                             return old->subId != 0 && !old->enabled && !old->working &&
                                    old->fileTime == item.fileTime;
                         });
    return deadly;
}
