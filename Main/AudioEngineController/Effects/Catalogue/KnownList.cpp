#include "Main/AudioEngineController/Effects/Catalogue/KnownList.h"

#include <QFile>

#include <algorithm>
#include <iterator>
#include <tuple>

namespace {

int rankOf(const EffectRecord &record)
{
    if (record.isCrashedFile())
        return 0;
    return record.subId != 0 && !record.enabled ? 2 : 1;
}

/// Of the records of a file name, those of the full path, which come first.
KnownList::Records firstOfPath(KnownList::Records records, const QString &path)
{
    const auto others = std::find_if(records.begin(), records.end(), [&](const EffectRecord *record) {
        return !isSamePath(record->path, path);
    });
    records.erase(others, records.end());
    return records;
}

} // namespace

bool KnownList::file(const EffectRecord &record)
{
    const QString fileName = fileNameOf(record.path);
    const auto [first, last] = m_records.equal_range(fileName);
    const bool isThere =
        std::any_of(first, last, [&](const auto &entry) { return entry.second.id == record.id; });
    if (!isThere)
        m_records.emplace_hint(last, fileName, record);
    return !isThere;
}

EffectRecord *KnownList::recordForCrash(const EffectRecord &marker)
{
    for (const EffectRecord *record : recordsOfFileName(marker.path)) {
        const bool isSame = record->isSamePlugin(marker);
        // The crash of a whole shell is none of its sub-plug-ins': their records stay, beside a new one for
        // the file.
        const bool isMoved = marker.subId == 0 && record->subId == 0 && !QFile::exists(record->path);
        if (isSame || isMoved)
            return const_cast<EffectRecord *>(record); // one of ours, handed out as const
    }
    return nullptr;
}

void KnownList::followMove(const QString &path)
{
    const Knowledge known = lookUp(path);
    if (known.how != KnownAs::Moved)
        return;
    for (const EffectRecord *record : known.records)
        const_cast<EffectRecord *>(record)->path = path; // one of ours, handed out as const
}

EffectRecord &KnownList::applyCrash(const EffectRecord &marker)
{
    followMove(marker.path);
    EffectRecord *record = recordForCrash(marker);
    if (!record)
        record = &m_records.emplace(fileNameOf(marker.path), marker)->second;
    record->path = marker.path;
    record->fileTime = marker.fileTime;
    record->enabled = false;
    record->working = false;
    return *record;
}

KnownList::Records KnownList::recordsOfFileName(const QString &path) const
{
    Records records;
    const auto [first, last] = m_records.equal_range(fileNameOf(path));
    for (auto entry = first; entry != last; ++entry)
        records.push_back(&entry->second);
    const auto place = [&](const EffectRecord *record) {
        return std::make_tuple(!isSamePath(record->path, path), rankOf(*record));
    };
    if (records.size() > 1) // most have one, and sorting allocates
        std::stable_sort(
            records.begin(), records.end(),
            [&](const EffectRecord *left, const EffectRecord *right) { return place(left) < place(right); });
    return records;
}

KnownList::Records KnownList::recordsOfPath(const QString &path) const
{
    return firstOfPath(recordsOfFileName(path), path);
}

KnownList::Knowledge KnownList::lookUp(const QString &path) const
{
    Records ofName = recordsOfFileName(path);
    if (ofName.empty())
        return {KnownAs::Unknown, {}};
    if (isSamePath(ofName.front()->path, path))
        return {KnownAs::Own, firstOfPath(std::move(ofName), path)};
    Records moved;
    std::copy_if(ofName.begin(), ofName.end(), std::back_inserter(moved),
                 [](const EffectRecord *record) { return !QFile::exists(record->path); });
    if (!moved.empty())
        return {KnownAs::Moved, std::move(moved)};
    if (ofName.front()->isCrashedFile())
        return {KnownAs::Unknown, {}};
    return {KnownAs::Namesake, std::move(ofName)};
}

bool KnownList::isIdHeldByOther(const QString &id, const EffectRecord &plugin) const
{
    return std::any_of(m_records.begin(), m_records.end(), [&](const auto &entry) {
        return entry.second.id == id && !entry.second.isSamePlugin(plugin);
    });
}

KnownList::Records KnownList::all() const
{
    Records records;
    records.reserve(m_records.size());
    for (const auto &entry : m_records)
        records.push_back(&entry.second);
    return records;
}
