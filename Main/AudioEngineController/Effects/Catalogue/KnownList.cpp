#include "Main/AudioEngineController/Effects/Catalogue/KnownList.h"

#include <algorithm>
#include <tuple>

namespace {

int rankOf(const EffectRecord &record)
{
    if (record.isCrashedFile())
        return record.standsForFile() ? 0 : 1;
    if (record.standsForFile())
        return 2;
    return record.enabled ? 3 : 4;
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
    m_records.clear();
}

bool KnownList::addRecord(const EffectRecord &record)
{
    const QString fileName = fileNameOf(record.path);
    const auto [first, last] = m_byFileName.equal_range(fileName);
    const bool isThere = std::any_of(first, last, [&](const auto &entry) {
        return entry.second->id == record.id && isSamePath(entry.second->path, record.path);
    });
    if (isThere)
        return false;
    m_records.push_back(record);
    m_byFileName.emplace_hint(last, fileName, &m_records.back());
    return true;
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

EffectRecord &KnownList::applyCrash(const EffectRecord &marker)
{
    EffectRecord *record = find(marker);
    if (!record) {
        m_records.push_back(marker);
        record = &m_records.back();
        m_byFileName.emplace(fileNameOf(marker.path), record);
    }
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
    Records records;
    const auto [first, last] = m_byFileName.equal_range(fileNameOf(path));
    for (auto entry = first; entry != last; ++entry)
        records.push_back(entry->second);
    if (records.size() < 2) // most have one, and sorting allocates
        return records;
    const auto place = [&](const EffectRecord *record) {
        return std::make_tuple(!isSamePath(record->path, path), rankOf(*record));
    };
    std::stable_sort(
        records.begin(), records.end(),
        [&](const EffectRecord *left, const EffectRecord *right) { return place(left) < place(right); });
    return records;
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
    return std::any_of(m_records.begin(), m_records.end(), [&](const EffectRecord &record) {
        return record.id == id && !record.isSamePlugin(plugin);
    });
}

KnownList::Records KnownList::all() const
{
    Records records;
    records.reserve(m_records.size());
    for (const auto &entry : m_byFileName)
        records.push_back(entry.second);
    return records;
}
