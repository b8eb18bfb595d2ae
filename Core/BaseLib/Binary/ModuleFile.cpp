#include "Core/BaseLib/Binary/ModuleFile.h"

#include "Core/BaseLib/Binary/LoadFailure.h"
#include "Core/BaseLib/Binary/PagedFile.h"
#include "Core/BaseLib/Binary/PeFormat.h"
#include "Core/BaseLib/Binary/PeImage.h"

#include <QLocale>

#include <limits>

namespace {

using Verdict = ModuleInspection::Verdict;

const QByteArray kElfMagic("\x7f"
                           "ELF");
constexpr quint64 kElfClass = 4; ///< where the byte stands that is 1 for 32 and 2 for 64 bits
constexpr quint64 kElfOrder = 5; ///< and the one that is 1 where the lowest byte of a number comes first
constexpr quint64 kElfMachine = 18;
constexpr quint16 kElfMachineX86_64 = 62;
constexpr quint32 kElfSegmentUnused = 0;       ///< PT_NULL
constexpr quint32 kElfSegmentDynamic = 2;      ///< PT_DYNAMIC: what the loader needs to know
constexpr quint16 kElfCountElsewhere = 0xffff; ///< PN_XNUM: more segments than fit
constexpr quint64 kPage = 4096;                ///< bytes: disks write in such units

/// Where the numbers that tell the size of an ELF file stand in its header, and in that of a segment.
struct ElfLayout {
    quint64 width; ///< of an offset, in bytes
    quint64 headerSize;
    quint64 segments, sections; ///< offsets of the tables
    quint64 counts; ///< size and count of segment headers, then of section headers, and the place among these
                    ///< of the one that leads to their names, 16 bits each
    quint64 segmentOffset, segmentSize;
};
constexpr ElfLayout kElf32{4, 52, 28, 32, 42, 4, 16};
constexpr ElfLayout kElf64{8, 64, 32, 40, 54, 8, 32};

/// The end of a range in a file; the end of all when there is no such place.
quint64 endOf(quint64 offset, quint64 size)
{
    return size > std::numeric_limits<quint64>::max() - offset ? std::numeric_limits<quint64>::max()
                                                               : offset + size;
}

quint64 numberAt(ByteView bytes, quint64 offset, quint64 width)
{
    const ByteView at = bytes.from(offset);
    return width == sizeof(quint32) ? at.item<quint32>(0).value_or(0) : at.item<quint64>(0).value_or(0);
}

/// What a file that is whole has.
struct Extent {
    quint64 end = 0;      ///< where it must not end before; 0 when it does not tell
    bool isBlank = false; ///< only zeros are where something must be: space was made for it, and no more
};

Extent elfExtent(ByteView file)
{
    if (file.from(kElfOrder).item<uchar>(0).value_or(1) != 1)
        return {};
    const ElfLayout &layout = file.from(kElfClass).item<uchar>(0) == 1 ? kElf32 : kElf64;
    quint64 end = layout.headerSize;
    if (file.size() < end)
        return {end};
    const ByteView counts = file.from(layout.counts);
    const quint64 segmentHeader = counts.item<quint16>(0).value_or(0);
    const quint16 segmentCount = counts.item<quint16>(1).value_or(0);
    const quint64 sectionHeader = counts.item<quint16>(2).value_or(0);
    const quint16 sectionCount = counts.item<quint16>(3).value_or(0);
    const quint16 sectionOfNames = counts.item<quint16>(4).value_or(0);
    const quint64 sections = numberAt(file, layout.sections, layout.width);
    if (sectionHeader * sectionCount > 0)
        end = endOf(sections, sectionHeader * sectionCount);
    // The loader needs no section, but linkers put them behind all else: what ends in zeros is blank here.
    bool isBlank = sectionOfNames > 0 && sectionOfNames < sectionCount &&
                   file.from(endOf(sections, sectionOfNames * sectionHeader)).hasOnlyZeros(sectionHeader);
    if (segmentCount == kElfCountElsewhere)
        return {end, isBlank};
    const quint64 table = numberAt(file, layout.segments, layout.width);
    end = std::max(end, endOf(table, segmentHeader * segmentCount));
    for (quint64 index = 0; end <= file.size() && index < segmentCount; ++index) {
        const ByteView header = file.from(table + index * segmentHeader);
        const quint64 size = numberAt(header, layout.segmentSize, layout.width);
        const quint32 type = header.item<quint32>(0).value_or(kElfSegmentUnused);
        if (size == 0 || type == kElfSegmentUnused)
            continue;
        const quint64 offset = numberAt(header, layout.segmentOffset, layout.width);
        end = std::max(end, endOf(offset, size));
        // Each entry is two numbers.
        isBlank |= type == kElfSegmentDynamic && file.from(offset).hasOnlyZeros(2 * layout.width);
    }
    return {end, isBlank};
}

/// None when it is no PE file after all, but a program of DOS.
std::optional<Extent> peExtent(ByteView file)
{
    const auto start = file.from(kDosNewHeader).item<quint32>(0);
    if (start && *start >= kMostPeStart)
        return std::nullopt; // a text
    const quint64 headerEnd = start.value_or(kDosNewHeader) + sizeof(PeHeader);
    if (!start || file.size() < headerEnd)
        return Extent{headerEnd};
    const PeHeader header = file.from(*start).item<PeHeader>(0).value_or(PeHeader{});
    if (header.magic != kPeMagic)
        return std::nullopt;
    const quint64 sections = headerEnd + header.optionalHeaderSize;
    quint64 end = sections + header.sectionCount * sizeof(PeSection);
    for (quint64 index = 0; end <= file.size() && index < header.sectionCount; ++index) {
        const PeSection section = file.from(sections).item<PeSection>(index).value_or(PeSection{});
        if (section.fileSize > 0 && section.offset > 0)
            end = std::max(end, endOf(section.offset, section.fileSize));
    }
    const std::optional<PeImage> image = PeImage::read(file);
    return Extent{end, image && image->isBlank()};
}

quint16 machineOf(LibraryForm form, ByteView file)
{
    const quint64 header = numberAt(file, kDosNewHeader, sizeof(quint32));
    const quint64 place = form == LibraryForm::Elf ? kElfMachine : header + offsetof(PeHeader, machine);
    return file.from(place).item<quint16>(0).value_or(0);
}

QString machineName(LibraryForm form, quint16 machine)
{
    const struct {
        LibraryForm form;
        quint16 machine;
        const char *name;
    } names[] = {{LibraryForm::Elf, kElfMachineX86_64, nullptr},
                 {LibraryForm::Elf, 3, "32-bit x86"},
                 {LibraryForm::Elf, 40, "32-bit ARM"},
                 {LibraryForm::Elf, 183, "64-bit ARM"},
                 {LibraryForm::Elf, 243, "RISC-V"},
                 {LibraryForm::Pe, kPeMachineX86_64, nullptr},
                 {LibraryForm::Pe, kPeMachineX86, "32-bit x86"},
                 {LibraryForm::Pe, kPeMachineArm, "32-bit ARM"},
                 {LibraryForm::Pe, kPeMachineArm64, "64-bit ARM"},
                 {LibraryForm::Pe, kPeMachineItanium, "Itanium"}};
    for (const auto &known : names)
        if (known.form == form && known.machine == machine)
            return QString::fromLatin1(known.name);
    return QStringLiteral("another kind of machine");
}

/// Why this machine cannot run it; null when it can.
QString foreignness(LibraryForm form, ByteView file)
{
    if (form != kOwnForm)
        return QLatin1String(kBuiltFor) + (form == LibraryForm::Pe
                                               ? QStringLiteral("Windows; this machine needs one for Linux")
                                               : QStringLiteral("Linux; this machine needs one for Windows"));
    const QString name = machineName(form, machineOf(form, file));
    return name.isNull() ? name
                         : QLatin1String(kBuiltFor) + name + QLatin1String("; this machine needs 64-bit x86");
}

/// Whether so few bytes are there that they may become any library's.
bool mayBecomeLibrary(const QByteArray &start)
{
    return kElfMagic.startsWith(start) || QByteArray("MZ").startsWith(start);
}

} // namespace

ModuleInspection inspectContent(ByteView file, const std::vector<QByteArray> &exports)
{
    QByteArray start;
    while (start.size() < kElfMagic.size() && static_cast<quint64>(start.size()) < file.size())
        start.append(file.item<char>(static_cast<quint64>(start.size())).value_or('\0'));
    if (start.isEmpty())
        return {Verdict::CutShort, QLatin1String(kEmptyFile)};
    const bool isElf = start == kElfMagic;
    const bool isPe = file.item<quint16>(0) == kDosMagic;
    std::optional<Extent> whole = isElf ? elfExtent(file) : peExtent(file);
    if (!isElf && !isPe)
        whole = mayBecomeLibrary(start) ? std::make_optional(Extent{file.size() + 1}) : std::nullopt;
    if (file.hasOnlyZeros(std::min(file.size(), kPage)))
        whole = Extent{0, true};
    if (!whole)
        return {Verdict::NoLibrary, QStringLiteral("it is not a program library")};
    if (whole->end > file.size())
        return {Verdict::CutShort, QStringLiteral("%1: %2 of at least %3 bytes are there")
                                       .arg(QLatin1String(kCutShort))
                                       .arg(file.size())
                                       .arg(whole->end)};
    if (whole->isBlank)
        return {Verdict::CutShort, QLatin1String(kCutShort) + QStringLiteral(": a part of it is blank")};
    const QString foreign = foreignness(isElf ? LibraryForm::Elf : LibraryForm::Pe, file);
    if (!exports.empty() && findExports(file, exports) == ExportAnswer::NotExported)
        return {Verdict::NoExport, QStringLiteral("it does not export what was asked for")};
    if (!foreign.isNull())
        return {Verdict::Foreign, foreign};
    return {};
}

ModuleInspection inspectModule(const QString &path, const std::vector<QByteArray> &exports)
{
    PagedFile file(path);
    if (!file.problem().isEmpty())
        return {Verdict::Unopened, QLatin1String(kUnopened) + file.problem()};
    return inspectContent(file.content(), exports);
}
