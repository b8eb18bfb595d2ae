#pragma once

#include <QString>
#include <QStringList>

#include <array>
#include <vector>

/// One category that the workstation's browser lists plug-ins under.
struct Category {
    int index;        ///< 1 to 27; part of the file form, so it never changes
    const char *key;  ///< short key
    const char *name; ///< display name
};

/// The categories, and the two forms of a set of them.
///
/// In files a set is a mask with bit (1 << index) for each category. In memory it is a mask with bit (1 <<
/// position), the position being the category's place in the display names sorted by code unit, from 0.
class CategoryTable {
public:
    static constexpr int kCount = 27;
    static constexpr int kInstrumentIndex = 7;
    static constexpr int kAmbisonicsIndex = 26;

    /// Built on first use.
    static const CategoryTable &instance();

    static const std::array<Category, kCount> &categories();

    /// The display names in ascending order, as the browser shows them.
    const QStringList &sortedNames() const { return m_sortedNames; }
    int instrumentPosition() const { return m_instrumentPosition; }
    int ambisonicsPosition() const { return m_ambisonicsPosition; }

    /// File form to internal form. Bits that name no category are dropped.
    quint32 maskToCategory(quint32 mask) const;
    /// Internal form to file form. Bits that name no category are dropped.
    quint32 categoryToMask(quint32 category) const;
    /// The internal form of the set that holds the category of that index only.
    quint32 internalBit(int index) const { return maskToCategory(1u << index); }

private:
    CategoryTable();

    struct BitPair {
        quint32 file;
        quint32 internal;
    };

    std::vector<BitPair> m_bits;
    QStringList m_sortedNames;
    int m_instrumentPosition = -1;
    int m_ambisonicsPosition = -1;
};
