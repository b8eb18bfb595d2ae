#include "Core/BaseLib/Binary/ElfTables.h"

#include "Core/BaseLib/Binary/ElfFormat.h"
#include "Core/BaseLib/Binary/LoadedParts.h"

namespace {

bool isSharedLibrary(const ElfHeader &header)
{
    return std::memcmp(header.ident, kElfIdent, sizeof(kElfIdent)) == 0 && header.type == kElfTypeShared &&
           header.machine == kElfMachineX86_64 && header.programHeaderSize == sizeof(ElfProgramHeader);
}

bool addSegment(LoadedParts &segments, ByteView file, const ElfProgramHeader &header)
{
    const std::optional<ByteView> content = file.part(header.offset, header.fileSize);
    return content && segments.add(header.address, header.memorySize, *content);
}

struct LoadPlan {
    LoadedParts segments;
    std::optional<ElfProgramHeader> dynamic;

    bool add(ByteView file, const ElfProgramHeader &header)
    {
        if (header.type == kElfSegmentLoad)
            return addSegment(segments, file, header);
        if (header.type != kElfSegmentDynamic)
            return true;
        const bool isFirst = !dynamic;
        dynamic = header;
        return isFirst;
    }
};

std::optional<LoadPlan> readLoadPlan(ByteView file)
{
    const auto header = file.item<ElfHeader>(0);
    if (!header || !isSharedLibrary(*header))
        return std::nullopt;
    const ByteView table = file.from(header->programHeaders);
    LoadPlan plan;
    for (quint64 index = 0; index < header->programHeaderCount; ++index) {
        const auto segment = table.item<ElfProgramHeader>(index);
        if (!segment || !plan.add(file, *segment))
            return std::nullopt;
    }
    return plan;
}

/// The entries of the dynamic section that lead to symbols. As in the loader, a repeated entry replaces the
/// one before.
struct DynamicSection {
    std::optional<quint64> symbols, symbolSize, strings, stringsSize, hash, gnuHash;

    void take(const ElfDynamicEntry &entry)
    {
        switch (entry.tag) {
        case kElfDynamicSymbols:
            symbols = entry.value;
            break;
        case kElfDynamicSymbolSize:
            symbolSize = entry.value;
            break;
        case kElfDynamicStrings:
            strings = entry.value;
            break;
        case kElfDynamicStringsSize:
            stringsSize = entry.value;
            break;
        case kElfDynamicHash:
            hash = entry.value;
            break;
        case kElfDynamicGnuHash:
            gnuHash = entry.value;
            break;
        default:
            break;
        }
    }

    const std::optional<quint64> &lookup() const { return gnuHash ? gnuHash : hash; }
    bool isComplete() const
    {
        return symbols && symbolSize == sizeof(ElfSymbol) && strings && stringsSize && lookup();
    }
};

std::optional<DynamicSection> readDynamicSection(const LoadPlan &plan)
{
    if (!plan.dynamic)
        return std::nullopt;
    const auto content = plan.segments.from(plan.dynamic->address).part(0, plan.dynamic->fileSize);
    DynamicSection section;
    for (quint64 index = 0; content && index < kMostElfSteps; ++index) {
        const auto entry = content->item<ElfDynamicEntry>(index);
        if (!entry)
            break;
        if (entry->tag == kElfDynamicEnd)
            return section;
        section.take(*entry);
    }
    return std::nullopt; // without an end, or with none in reach
}

} // namespace

std::optional<ElfTables> readElfTables(ByteView file)
{
    const std::optional<LoadPlan> plan = readLoadPlan(file);
    const std::optional<DynamicSection> dynamic = plan ? readDynamicSection(*plan) : std::nullopt;
    if (!dynamic || !dynamic->isComplete())
        return std::nullopt;
    const LoadedParts &segments = plan->segments;
    const std::optional<ByteView> strings = segments.from(*dynamic->strings).part(0, *dynamic->stringsSize);
    if (!strings)
        return std::nullopt;
    return ElfTables{segments.from(*dynamic->symbols), *strings, segments.from(*dynamic->lookup()),
                     dynamic->gnuHash.has_value()};
}
