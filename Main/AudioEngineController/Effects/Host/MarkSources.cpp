#include "Main/AudioEngineController/Effects/Host/MarkSources.h"

namespace {

/// A lone record that stands for a whole file, as catalogues of earlier versions hold; null when there is
/// none.
const EffectRecord *loneFileRecord(const KnownList::Records &records)
{
    return records.size() == 1 && records.front()->standsForFile() ? records.front() : nullptr;
}

} // namespace

void MarkSources::addAway(const KnownList::Records &records)
{
    m_away.insert(m_away.end(), records.begin(), records.end());
    m_missing.insert(m_missing.end(), records.begin(), records.end());
}

void MarkSources::addAsked(const KnownList::Records &records)
{
    for (const EffectRecord *record : records)
        if (!record->standsForFile() && !m_unsettled.contains(record->id))
            m_unsettled.insert(record->id, record);
}

void MarkSources::addCrashed(const EffectRecord *record, const QString &id)
{
    if (!m_unsettled.contains(id))
        m_unsettled.insert(id, record);
}

void MarkSources::addGone(const KnownList::Records &records)
{
    m_missing.insert(m_missing.end(), records.begin(), records.end());
    addAsked(records);
}

const EffectRecord *MarkSources::sourceOf(const ScanItem &item, const EffectRecord &probed, bool isOnly) const
{
    const auto isSame = [&](const EffectRecord &old) { return m_known.isSameOfFile(old, probed); };
    const auto hasId = [&](const EffectRecord &old) { return old.id == probed.id; };
    const auto isSamePlugin = [&](const EffectRecord &old) { return hasId(old) && !old.standsForFile(); };
    const EffectRecord *own = findRecord(item.known, isSame);
    if (own && hasId(*own))
        return own;
    // Also of a file that is there: its copy comes to list what it does not list any more. Before what had
    // the place: a file may have been moved over another.
    if (const EffectRecord *same = m_known.pluginOfFileName(item.path, probed.id))
        return same;
    if (const EffectRecord *same = findRecord(m_away, isSamePlugin))
        return same;
    if (own && (own->working || own->hasMarks()))
        return own;
    if (const EffectRecord *same = unsettled(probed))
        return same;
    const EffectRecord *child = missingChild(item, probed);
    if (child || own || !isOnly)
        return child ? child : own;
    const EffectRecord *lone = loneFileRecord(item.known);
    return lone ? lone : loneFileRecord(item.moved);
}

/// The same plug-in of another file that is asked as well, whichever of the two holds it from now on, or that
/// is gone: its version may have been a part of its name.
const EffectRecord *MarkSources::unsettled(const EffectRecord &probed) const
{
    return m_unsettled.value(probed.id); // a crash may have taken it the identifier since
}

/// The sub-plug-in of a missing namesake that crashed, and so lost its identifier.
const EffectRecord *MarkSources::missingChild(const ScanItem &item, const EffectRecord &probed) const
{
    if (probed.subName.isEmpty())
        return nullptr;
    return findRecord(m_missing, [&](const EffectRecord &old) {
        return m_known.isSameOfFile(old, probed) && old.subName == probed.subName &&
               isSamePath(fileNameOf(old.path), fileNameOf(item.path));
    });
}

const EffectRecord *MarkSources::likelySourceOf(const ScanItem &item, const EffectRecord &probed) const
{
    return findRecord(item.moved, [&](const EffectRecord &old) { return m_known.isSameOfFile(old, probed); });
}
