#include "Main/AudioEngineController/Effects/Catalogue/EffectList.h"

void EffectList::clear()
{
    m_entries.clear();
    m_names.clear();
}

const EffectRecord *EffectList::find(const QString &id) const
{
    const auto entry = m_entries.find(id);
    return entry == m_entries.end() ? nullptr : &entry->second.record;
}

bool EffectList::add(const EffectRecord &record)
{
    if (record.id.isEmpty())
        return false;
    const auto [entry, isNew] = m_entries.try_emplace(record.id);
    if (!isNew)
        return false;
    entry->second.record = record;
    const int before = m_names.size();
    m_names.insert(record.name);
    entry->second.ownsName = m_names.size() > before;
    if (!entry->second.ownsName)
        NameFromPath(entry->second.record);
    return true;
}

void EffectList::setFavourite(const QString &id, bool favourite)
{
    const auto entry = m_entries.find(id);
    if (entry == m_entries.end())
        return;
    entry->second.record.favourite = favourite;
    entry->second.forgetText();
}

void EffectList::passMarks(const EffectRecord &old, const QString &id)
{
    const auto entry = m_entries.find(id);
    if (entry == m_entries.end())
        return;
    takeMarks(entry->second.record, old);
    entry->second.forgetText();
}

void EffectList::setHidden(const QString &id, bool isHidden)
{
    if (const auto entry = m_entries.find(id); entry != m_entries.end())
        entry->second.isHidden = isHidden;
}

void EffectList::setUnsettled(const QString &id, bool isUnsettled)
{
    const auto entry = m_entries.find(id);
    if (entry == m_entries.end() || entry->second.isUnsettled == isUnsettled)
        return;
    entry->second.isUnsettled = isUnsettled;
    entry->second.forgetText();
}

void EffectList::remove(const QString &id)
{
    const auto entry = m_entries.find(id);
    if (entry == m_entries.end())
        return;
    if (entry->second.ownsName)
        m_names.remove(entry->second.record.name);
    m_entries.erase(entry);
}
