#include "Main/AudioEngineController/Effects/Catalogue/KnownList.h"

#include <algorithm>
#include <utility>

namespace {

int rankOf(const EffectRecord &record)
{
    if (record.isCrashedFile())
        return record.standsForFile() ? 0 : 1;
    if (record.standsForFile())
        return 2;
    return record.enabled ? 3 : 4;
}

/// Its place among the records of a file name: those of the full path first.
std::pair<bool, int> placeOf(const EffectRecord &record, const QString &path)
{
    return {!isSamePath(record.path, path), rankOf(record)};
}

void markCrashed(EffectRecord &record)
{
    record.enabled = false;
    record.working = false;
}

} // namespace

void KnownList::clear()
{
    m_byFileName.clear();
    m_byId.clear();
    m_records.clear();
}

const std::vector<EffectRecord *> &KnownList::recordsOfId(const QString &id) const
{
    static const std::vector<EffectRecord *> none;
    const auto found = m_byId.constFind(id);
    return found == m_byId.constEnd() ? none : *found;
}

EffectRecord &KnownList::insert(const EffectRecord &record)
{
    m_records.push_back(record);
    m_byFileName.emplace(fileNameOf(record.path), &m_records.back());
    m_byId[record.id].push_back(&m_records.back());
    return m_records.back();
}

bool KnownList::addRecord(const EffectRecord &record)
{
    if (holds(record.path, record.id))
        return false;
    insert(record);
    return true;
}

void KnownList::setIdentifier(const EffectRecord &record, const QString &id)
{
    std::vector<EffectRecord *> &before = m_byId[record.id];
    const auto entry = std::find(before.begin(), before.end(), &record);
    EffectRecord &changed = **entry;
    before.erase(entry);
    changed.id = id;
    m_byId[id].push_back(&changed);
}

/// The record that a marker is about: of a sub-plug-in its own, of a file the one that stands for it.
EffectRecord *KnownList::find(const EffectRecord &marker)
{
    const auto [first, last] = m_byFileName.equal_range(fileNameOf(marker.path));
    const auto found = std::find_if(first, last, [&](const auto &entry) {
        const EffectRecord &record = *entry.second;
        const bool isItsOwn =
            marker.subId != 0 || m_identity == Identity::SubPlugin || record.standsForFile();
        return record.isSamePlugin(marker) && isItsOwn;
    });
    return found == last ? nullptr : found->second;
}

const EffectRecord &KnownList::applyCrash(const EffectRecord &marker)
{
    EffectRecord *record = find(marker);
    if (!record)
        record = &insert(marker);
    record->fileTime = marker.fileTime;
    markCrashed(*record);
    if (marker.subId == 0)
        disableOthers(*record);
    return *record;
}

bool KnownList::disableBesideCrashed()
{
    bool hasChanged = false;
    for (const EffectRecord &record : m_records)
        if (record.isCrashedFile() && record.standsForFile())
            hasChanged |= disableOthers(record);
    return hasChanged;
}

bool KnownList::disableOthers(const EffectRecord &crashed)
{
    bool hasChanged = false;
    const auto [first, last] = m_byFileName.equal_range(fileNameOf(crashed.path));
    for (auto entry = first; entry != last; ++entry)
        if (isSamePath(entry->second->path, crashed.path) && !entry->second->isSwitchedOff()) {
            hasChanged |= entry->second->enabled;
            entry->second->fileTime = crashed.fileTime;
            markCrashed(*entry->second);
        }
    return hasChanged;
}

KnownList::Records KnownList::recordsOfFileName(const QString &path) const
{
    using Placed = std::pair<std::pair<bool, int>, const EffectRecord *>;
    std::vector<Placed> placed;
    const auto [first, last] = m_byFileName.equal_range(fileNameOf(path));
    for (auto entry = first; entry != last; ++entry)
        placed.push_back({placeOf(*entry->second, path), entry->second});
    std::stable_sort(placed.begin(), placed.end(),
                     [](const Placed &left, const Placed &right) { return left.first < right.first; });
    Records records;
    records.reserve(placed.size());
    for (const Placed &each : placed)
        records.push_back(each.second);
    return records;
}

const EffectRecord *KnownList::pluginOfFileName(const QString &path, const QString &id) const
{
    const EffectRecord *best = nullptr;
    for (const EffectRecord *record : recordsOfId(id))
        if (!record->standsForFile() && isSamePath(fileNameOf(record->path), fileNameOf(path)) &&
            (!best || placeOf(*record, path) < placeOf(*best, path)))
            best = record;
    return best;
}

bool KnownList::holds(const QString &path, const QString &id) const
{
    const std::vector<EffectRecord *> &records = recordsOfId(id);
    return std::any_of(records.begin(), records.end(),
                       [&](const EffectRecord *record) { return isSamePath(record->path, path); });
}

KnownList::Records KnownList::recordsOfPath(const QString &path) const
{
    Records records = recordsOfFileName(path);
    const auto others = std::find_if(records.begin(), records.end(), [&](const EffectRecord *record) {
        return !isSamePath(record->path, path);
    });
    records.erase(others, records.end());
    return records;
}

bool KnownList::isIdHeldByOther(const QString &id, const EffectRecord &plugin) const
{
    const std::vector<EffectRecord *> &records = recordsOfId(id);
    return std::any_of(records.begin(), records.end(),
                       [&](const EffectRecord *record) { return !record->isSamePlugin(plugin); });
}

KnownList::Records KnownList::all() const
{
    Records records;
    records.reserve(m_records.size());
    for (const auto &entry : m_byFileName)
        records.push_back(entry.second);
    return records;
}
