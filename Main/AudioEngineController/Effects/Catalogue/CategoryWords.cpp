#include "Main/AudioEngineController/Effects/Catalogue/CategoryWords.h"

#include "Main/AudioEngineController/Effects/Catalogue/CategoryTable.h"

void CategoryWords::add(const CategoryWord &word)
{
    for (const Category &category : CategoryTable::categories())
        if (qstrcmp(category.name, word.category) == 0)
            m_bits[QString::fromLatin1(word.word)] = CategoryTable::instance().internalBit(category.index);
}

quint32 CategoryWords::categoryOf(const QStringList &words) const
{
    quint32 category = 0;
    for (const QString &word : words) {
        const auto found = m_bits.find(word.trimmed());
        if (found != m_bits.end())
            category |= found->second;
    }
    return category;
}
