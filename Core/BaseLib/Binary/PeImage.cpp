#include "Core/BaseLib/Binary/PeImage.h"

namespace {

/// As many names as the 16-bit indexes of an export table can reach.
constexpr quint32 kMostPeNames = 1 << 16;
/// More libraries than any honest file imports.
constexpr quint64 kMostPeImports = 4096;
/// The longest name of a library that Windows accepts (MAX_PATH).
constexpr quint64 kLongestPeLibraryName = 260;

quint64 roundedUp(quint64 value, quint64 unit) { return (value + unit - 1) / unit * unit; }

/// Adds one section as the loader maps it: the file's content is visible up to the end of the last page.
bool addSection(LoadedParts &parts, ByteView file, const PeSection &section)
{
    const quint64 size = roundedUp(section.memorySize ? section.memorySize : section.fileSize, kPePage);
    if (section.fileSize == 0 || section.offset == 0)
        return parts.add(section.address, size, {});
    if (!file.part(section.offset, section.fileSize))
        return false;
    const quint64 offset = section.offset / kPeSector * kPeSector;
    const std::optional<ByteView> content = file.part(offset, std::min<quint64>(section.fileSize, size));
    return content && parts.add(section.address, size, *content);
}

bool isEnd(const PeImport &entry) { return entry.name == 0 || entry.addressTable == 0; }
bool isEnd(const PeDelayImport &entry) { return entry.name == 0; }
bool isReadable(const PeImport &) { return true; }
/// Old compilers wrote absolute addresses.
bool isReadable(const PeDelayImport &entry) { return (entry.flags & kPeDelayByAddress) != 0; }

struct Headers {
    PeHeader header;
    PeOptionalHeader optional;
    ByteView optionalBytes; ///< all of the optional header
    ByteView sections;      ///< from the section headers on

    bool is64Bit() const { return optional.magic == kPeOptionalMagic64; }
};

std::optional<Headers> findHeaders(ByteView file)
{
    const auto start = file.from(kDosNewHeader).item<quint32>(0);
    const ByteView bytes = start ? file.from(*start) : ByteView();
    const auto header = bytes.item<PeHeader>(0);
    if (file.item<quint16>(0) != kDosMagic || !header || header->magic != kPeMagic)
        return std::nullopt;
    const ByteView behind = bytes.from(sizeof(PeHeader));
    const auto optionalBytes = behind.part(0, header->optionalHeaderSize);
    const auto optional = optionalBytes ? optionalBytes->item<PeOptionalHeader>(0) : std::nullopt;
    if (!optional || (optional->magic != kPeOptionalMagic32 && optional->magic != kPeOptionalMagic64))
        return std::nullopt;
    return Headers{*header, *optional, *optionalBytes, behind.from(header->optionalHeaderSize)};
}

} // namespace

std::optional<PeImage> PeImage::read(ByteView file)
{
    const std::optional<Headers> found = findHeaders(file);
    if (!found)
        return std::nullopt;
    const ByteView directories =
        found->optionalBytes.from(found->is64Bit() ? kPeDirectoryCount64 : kPeDirectoryCount32);
    const quint64 size = quint64(directories.item<quint32>(0).value_or(0)) * sizeof(PeDirectory);
    const ByteView table = directories.from(sizeof(quint32));
    PeImage image;
    image.m_machine = found->header.machine;
    image.m_directories = table.part(0, size).value_or(table);
    image.m_isComplete = image.addParts(file, found->optional, found->sections, found->header.sectionCount);
    return image;
}

bool PeImage::addParts(ByteView file, const PeOptionalHeader &header, ByteView sections, quint16 sectionCount)
{
    if (header.sectionAlignment < kPePage) // drivers and the like, which the loader maps in another way
        return false;
    if (sectionCount > kMostPeSections) // looking anything up would take long
        return false;
    const std::optional<ByteView> headers = file.part(0, header.headersSize);
    bool isAdded = headers && m_parts.add(0, header.headersSize, *headers);
    for (quint64 index = 0; isAdded && index < sectionCount; ++index) {
        const auto section = sections.item<PeSection>(index);
        isAdded = section && addSection(m_parts, file, *section);
    }
    return isAdded;
}

PeDirectory PeImage::directory(quint32 index) const
{
    return m_directories.item<PeDirectory>(index).value_or(PeDirectory{});
}

bool PeImage::isBlank() const
{
    const struct {
        quint32 index, firstEntrySize;
    } tables[] = {{kPeDirectoryExports, sizeof(PeExports)},
                  {kPeDirectoryExceptions, kPeFunctionSize},
                  {kPeDirectoryRelocations, kPeRelocationHeaderSize}};
    return std::any_of(std::begin(tables), std::end(tables), [this](const auto &table) {
        const PeDirectory place = directory(table.index);
        return m_isComplete && place.address != 0 && place.size >= table.firstEntrySize &&
               m_parts.from(place.address).hasOnlyZeros(table.firstEntrySize);
    });
}

ExportAnswer PeImage::findExports(const std::vector<QByteArray> &names) const
{
    const quint32 address = directory(kPeDirectoryExports).address;
    if (!m_isComplete)
        return ExportAnswer::Unknown;
    if (address == 0)
        return ExportAnswer::NotExported;
    const auto table = m_parts.from(address).item<PeExports>(0);
    if (!table || table->nameCount > kMostPeNames)
        return ExportAnswer::Unknown;
    for (quint64 index = 0; index < table->nameCount; ++index) {
        const ExportAnswer answer = answerAt(*table, index, names);
        if (answer != ExportAnswer::NotExported)
            return answer;
    }
    return ExportAnswer::NotExported;
}

ExportAnswer PeImage::answerAt(const PeExports &table, quint64 index,
                               const std::vector<QByteArray> &names) const
{
    const auto name = m_parts.from(table.names).item<quint32>(index);
    const auto ordinal = m_parts.from(table.ordinals).item<quint16>(index);
    const ByteView text = name ? m_parts.from(*name) : ByteView();
    if (text.isEmpty() || !ordinal || *ordinal >= table.functionCount)
        return ExportAnswer::Unknown;
    const auto isText = [&](const QByteArray &wanted) { return text.holdsText(0, wanted); };
    if (std::none_of(names.begin(), names.end(), isText))
        return ExportAnswer::NotExported;
    const auto function = m_parts.from(table.functions).item<quint32>(*ordinal);
    if (!function)
        return ExportAnswer::Unknown;
    return *function != 0 ? ExportAnswer::Exported : ExportAnswer::NotExported;
}

std::optional<QStringList> PeImage::imports() const { return libraries<PeImport>(kPeDirectoryImports); }

std::optional<QStringList> PeImage::delayImports() const
{
    return libraries<PeDelayImport>(kPeDirectoryDelayImports);
}

template <typename Entry>
std::optional<QStringList> PeImage::libraries(quint32 directoryIndex) const
{
    const quint32 address = directory(directoryIndex).address;
    const ByteView table = m_parts.from(address);
    QStringList names;
    for (quint64 index = 0; m_isComplete && address != 0 && index < kMostPeImports; ++index) {
        const auto entry = table.item<Entry>(index);
        if (entry && isEnd(*entry))
            return names;
        const auto name = entry && isReadable(*entry)
                              ? m_parts.from(entry->name).text(0, kLongestPeLibraryName)
                              : std::nullopt;
        if (!name)
            return std::nullopt;
        names.append(QString::fromLocal8Bit(*name));
    }
    return m_isComplete && address == 0 ? std::make_optional(names) : std::nullopt;
}

ExportAnswer findPeExports(ByteView file, const std::vector<QByteArray> &names)
{
    const std::optional<PeImage> image = PeImage::read(file);
    return image ? image->findExports(names) : ExportAnswer::Unknown;
}
