#include "Core/BaseLib/Binary/posix/ElfTables.h"

#include "Core/BaseLib/Binary/LoadedParts.h"

#include <QFile>

#include <utility>

#include <elf.h>

static_assert(Q_BYTE_ORDER == Q_LITTLE_ENDIAN, "fields are copied as they stand in the file");

namespace {

/// More than any honest library needs.
constexpr std::size_t kMostElfNames = 4096;
constexpr quint64 kLongestElfName = 4096; ///< PATH_MAX

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

/// The entries of the dynamic section that lead to symbols and to other libraries. As in the loader, a
/// repeated entry replaces the one before.
struct DynamicSection {
    std::optional<quint64> symbols, symbolSize, strings, stringsSize, hash, gnuHash;
    std::vector<std::pair<Elf64_Sxword, quint64>> names; ///< tags and offsets among the strings

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
        case DT_NEEDED:
        case DT_RPATH:
        case DT_RUNPATH:
            if (names.size() < kMostElfNames)
                names.emplace_back(entry.d_tag, entry.d_un.d_val);
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

std::optional<ElfNeeds> readElfNeeds(ByteView file)
{
    const std::optional<LoadPlan> plan = readLoadPlan(file);
    const std::optional<DynamicSection> dynamic = plan ? readDynamicSection(*plan) : std::nullopt;
    if (!dynamic || !dynamic->strings)
        return std::nullopt;
    const ByteView strings = plan->segments.from(*dynamic->strings);
    ElfNeeds needs;
    for (const auto &[tag, offset] : dynamic->names) {
        const std::optional<QByteArray> name = strings.text(offset, kLongestElfName);
        if (!name)
            return std::nullopt;
        if (tag == DT_NEEDED)
            needs.libraries.append(QFile::decodeName(*name));
        else
            (tag == DT_RPATH ? needs.olderFolders : needs.folders)
                .append(QFile::decodeName(*name).split(QLatin1Char(':'), Qt::SkipEmptyParts));
    }
    return needs;
}
