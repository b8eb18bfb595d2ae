#include "Core/BaseLib/Binary/posix/ElfTables.h"

#include "Core/BaseLib/Binary/LoadedParts.h"

#include <elf.h>

static_assert(Q_BYTE_ORDER == Q_LITTLE_ENDIAN, "fields are copied as they stand in the file");

namespace {

bool isSharedLibrary(const Elf64_Ehdr &header)
{
    return std::memcmp(header.e_ident, ELFMAG, SELFMAG) == 0 && header.e_ident[EI_CLASS] == ELFCLASS64 &&
           header.e_ident[EI_DATA] == ELFDATA2LSB && header.e_ident[EI_VERSION] == EV_CURRENT &&
           header.e_type == ET_DYN && header.e_machine == EM_X86_64 &&
           header.e_phentsize == sizeof(Elf64_Phdr);
}

bool addSegment(LoadedParts &segments, ByteView file, const Elf64_Phdr &header)
{
    const std::optional<ByteView> content = file.part(header.p_offset, header.p_filesz);
    return content && segments.add(header.p_vaddr, header.p_memsz, *content);
}

struct LoadPlan {
    LoadedParts segments;
    std::optional<Elf64_Phdr> dynamic;

    bool add(ByteView file, const Elf64_Phdr &header)
    {
        if (header.p_type == PT_LOAD)
            return addSegment(segments, file, header);
        if (header.p_type != PT_DYNAMIC)
            return true;
        const bool isFirst = !dynamic;
        dynamic = header;
        return isFirst;
    }
};

std::optional<LoadPlan> readLoadPlan(ByteView file)
{
    const auto header = file.item<Elf64_Ehdr>(0);
    if (!header || !isSharedLibrary(*header))
        return std::nullopt;
    const ByteView table = file.from(header->e_phoff);
    LoadPlan plan;
    for (quint64 index = 0; index < header->e_phnum; ++index) {
        const auto segment = table.item<Elf64_Phdr>(index);
        if (!segment || !plan.add(file, *segment))
            return std::nullopt;
    }
    return plan;
}

/// The entries of the dynamic section that lead to symbols. As in the loader, a repeated entry replaces the
/// one before.
struct DynamicSection {
    std::optional<quint64> symbols, symbolSize, strings, stringsSize, hash, gnuHash;

    void take(const Elf64_Dyn &entry)
    {
        switch (entry.d_tag) {
        case DT_SYMTAB:
            symbols = entry.d_un.d_val;
            break;
        case DT_SYMENT:
            symbolSize = entry.d_un.d_val;
            break;
        case DT_STRTAB:
            strings = entry.d_un.d_val;
            break;
        case DT_STRSZ:
            stringsSize = entry.d_un.d_val;
            break;
        case DT_HASH:
            hash = entry.d_un.d_val;
            break;
        case DT_GNU_HASH:
            gnuHash = entry.d_un.d_val;
            break;
        default:
            break;
        }
    }

    const std::optional<quint64> &lookup() const { return gnuHash ? gnuHash : hash; }
    bool isComplete() const
    {
        return symbols && symbolSize == sizeof(Elf64_Sym) && strings && stringsSize && lookup();
    }
};

std::optional<DynamicSection> readDynamicSection(const LoadPlan &plan)
{
    if (!plan.dynamic)
        return std::nullopt;
    const auto content = plan.segments.from(plan.dynamic->p_vaddr).part(0, plan.dynamic->p_filesz);
    DynamicSection section;
    for (quint64 index = 0; content && index < kMostElfSteps; ++index) {
        const auto entry = content->item<Elf64_Dyn>(index);
        if (!entry)
            break;
        if (entry->d_tag == DT_NULL)
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

std::optional<quint16> elfMachine(ByteView file)
{
    const auto header = file.item<Elf32_Ehdr>(0); // the two forms differ behind this field
    if (!header || std::memcmp(header->e_ident, ELFMAG, SELFMAG) != 0)
        return std::nullopt;
    return header->e_machine;
}
