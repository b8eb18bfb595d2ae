#include "Core/BaseLib/Binary/posix/ElfTables.h"

#include <elf.h>

namespace {

/// Starts the table of DT_HASH. Follow: 32-bit symbol indexes, one per bucket, then one per symbol: the next
/// of the same bucket. Index 0 ends a chain.
struct HashHeader {
    quint32 bucketCount;
    quint32 symbolCount;
};

/// Starts the table of DT_GNU_HASH, which <elf.h> leaves out. Follow: the 64-bit words of a Bloom filter, the
/// 32-bit index of each bucket's first symbol (0: empty), then, for each symbol from `firstSymbol` on, its
/// 32-bit hash with the lowest bit set on the last symbol of its bucket.
struct GnuHashHeader {
    quint32 bucketCount;
    quint32 firstSymbol;
    quint32 filterSize; ///< in words; a power of two
    quint32 filterShift;
};

bool isExport(const Elf64_Sym &symbol)
{
    const int binding = ELF64_ST_BIND(symbol.st_info);
    const int visibility = ELF64_ST_VISIBILITY(symbol.st_other);
    return symbol.st_shndx != SHN_UNDEF &&
           (binding == STB_GLOBAL || binding == STB_WEAK || binding == STB_GNU_UNIQUE) &&
           (visibility == STV_DEFAULT || visibility == STV_PROTECTED);
}

/// Whether the symbol at an index is an export of that name.
ExportAnswer answerAt(const ElfTables &tables, quint64 index, const QByteArray &name)
{
    const auto symbol = tables.symbols.item<Elf64_Sym>(index);
    if (!symbol || symbol->st_name >= tables.strings.size())
        return ExportAnswer::Unknown;
    return tables.strings.holdsText(symbol->st_name, name) && isExport(*symbol) ? ExportAnswer::Exported
                                                                                : ExportAnswer::NotExported;
}

quint32 hashOf(const QByteArray &name)
{
    quint32 hash = 0;
    for (const char character : name) {
        hash = (hash << 4) + static_cast<uchar>(character);
        const quint32 high = hash & 0xf0000000;
        hash = (hash ^ (high >> 24)) & ~high;
    }
    return hash;
}

ExportAnswer findByHash(const ElfTables &tables, const QByteArray &name)
{
    const auto header = tables.hash.item<HashHeader>(0);
    if (!header || header->bucketCount == 0)
        return ExportAnswer::Unknown;
    const ByteView buckets = tables.hash.from(sizeof(HashHeader));
    const ByteView chains = buckets.from(quint64(header->bucketCount) * sizeof(quint32));
    auto index = buckets.item<quint32>(hashOf(name) % header->bucketCount);
    // A chain that leads to more symbols than the table holds goes in circles.
    const quint64 most = std::min<quint64>(chains.size() / sizeof(quint32), kMostElfSteps);
    for (quint64 step = 0; index && *index < header->symbolCount && step < most; ++step) {
        if (*index == 0)
            return ExportAnswer::NotExported;
        const ExportAnswer answer = answerAt(tables, *index, name);
        if (answer != ExportAnswer::NotExported)
            return answer;
        index = chains.item<quint32>(*index);
    }
    return ExportAnswer::Unknown; // or it leads out of the table
}

quint32 gnuHashOf(const QByteArray &name)
{
    quint32 hash = 5381;
    for (const char character : name)
        hash = hash * 33 + static_cast<uchar>(character);
    return hash;
}

/// Follows the symbols of one bucket.
ExportAnswer findInGnuChain(const ElfTables &tables, ByteView chains, quint64 firstSymbol, quint64 index,
                            const QByteArray &name)
{
    const quint32 wanted = gnuHashOf(name) | 1;
    for (quint64 step = 0; step < kMostElfSteps; ++step, ++index) {
        const auto hash = chains.item<quint32>(index - firstSymbol);
        if (!hash)
            return ExportAnswer::Unknown;
        const ExportAnswer answer =
            (*hash | 1) == wanted ? answerAt(tables, index, name) : ExportAnswer::NotExported;
        if (answer != ExportAnswer::NotExported || (*hash & 1) != 0)
            return answer;
    }
    return ExportAnswer::Unknown;
}

/// Whether the Bloom filter lets a hash pass; none when the filter cannot be read.
std::optional<bool> passesFilter(ByteView filter, const GnuHashHeader &header, quint32 hash)
{
    const bool isPowerOfTwo = header.filterSize != 0 && (header.filterSize & (header.filterSize - 1)) == 0;
    if (!isPowerOfTwo || header.filterShift >= 32)
        return std::nullopt;
    const auto word = filter.item<quint64>((hash / 64) & (header.filterSize - 1));
    if (!word)
        return std::nullopt;
    return ((*word >> (hash % 64)) & (*word >> ((hash >> header.filterShift) % 64)) & 1) != 0;
}

ExportAnswer findByGnuHash(const ElfTables &tables, const QByteArray &name)
{
    const auto header = tables.hash.item<GnuHashHeader>(0);
    if (!header || header->bucketCount == 0)
        return ExportAnswer::Unknown;
    const quint32 hash = gnuHashOf(name);
    const ByteView filter = tables.hash.from(sizeof(GnuHashHeader));
    const std::optional<bool> passes = passesFilter(filter, *header, hash);
    const ByteView buckets = filter.from(quint64(header->filterSize) * sizeof(quint64));
    const auto first = buckets.item<quint32>(hash % header->bucketCount);
    if (!passes || !first)
        return ExportAnswer::Unknown;
    if (!*passes || *first == 0)
        return ExportAnswer::NotExported;
    if (*first < header->firstSymbol)
        return ExportAnswer::Unknown;
    const ByteView chains = buckets.from(quint64(header->bucketCount) * sizeof(quint32));
    return findInGnuChain(tables, chains, header->firstSymbol, *first, name);
}

} // namespace

ExportAnswer findElfExports(ByteView file, const std::vector<QByteArray> &names)
{
    const std::optional<ElfTables> tables = readElfTables(file);
    if (!tables)
        return ExportAnswer::Unknown;
    for (const QByteArray &name : names) {
        const ExportAnswer answer =
            tables->isGnuHash ? findByGnuHash(*tables, name) : findByHash(*tables, name);
        if (answer != ExportAnswer::NotExported)
            return answer;
    }
    return ExportAnswer::NotExported;
}
