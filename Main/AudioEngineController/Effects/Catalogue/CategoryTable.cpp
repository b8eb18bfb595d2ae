#include "Main/AudioEngineController/Effects/Catalogue/CategoryTable.h"

#include <map>

namespace {

constexpr std::array<Category, CategoryTable::kCount> kCategories = {{
    {1, "chan", "Channel"},
    {2, "dly", "Delay"},
    {3, "dyn", "Dynamics"},
    {4, "eq", "EQ"},
    {5, "harm", "Harmonic"},
    {6, "img", "Spatial"},
    {7, "inst", "Instrument"},
    {8, "mst", "Mastering"},
    {9, "meter", "Metering"},
    {10, "multi", "Multi Effect"},
    {11, "mod", "Modulation"},
    {12, "nr", "Restoration"},
    {13, "pitch", "Pitch"},
    {14, "rvb", "Reverb"},
    {15, "surr", "Surround"},
    {16, "tool", "Tools"},
    {17, "other", "Other"},
    {18, "decoder", "Decoder"},
    {19, "voc", "Vocals"},
    {20, "bass", "Bass"},
    {21, "guitar", "Guitar"},
    {22, "drums", "Drums"},
    {23, "dist", "Distortion"},
    {24, "ana", "Analysis"},
    {25, "mon", "Monitor"},
    {26, "ambi", "Ambisonics"},
    // Sorts before all others and takes the internal bit 0: every other category's bit depends on it.
    {27, "dummy", "-"},
}};

} // namespace

const CategoryTable &CategoryTable::instance()
{
    static const CategoryTable table;
    return table;
}

const std::array<Category, CategoryTable::kCount> &CategoryTable::categories() { return kCategories; }

CategoryTable::CategoryTable()
{
    std::map<QString, int> byName;
    for (const Category &category : kCategories)
        byName.emplace(QString::fromLatin1(category.name), category.index);
    int position = 0;
    for (const auto &[name, index] : byName) {
        m_sortedNames.append(name);
        m_bits.push_back({1u << index, 1u << position});
        if (index == kInstrumentIndex)
            m_instrumentPosition = position;
        if (index == kAmbisonicsIndex)
            m_ambisonicsPosition = position;
        ++position;
    }
}

quint32 CategoryTable::maskToCategory(quint32 mask) const
{
    quint32 category = 0;
    for (const BitPair &bits : m_bits)
        if (mask & bits.file)
            category |= bits.internal;
    return category;
}

quint32 CategoryTable::categoryToMask(quint32 category) const
{
    quint32 mask = 0;
    for (const BitPair &bits : m_bits)
        if (category & bits.internal)
            mask |= bits.file;
    return mask;
}
