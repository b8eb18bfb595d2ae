#include "Core/BaseLib/Binary/posix/ElfTables.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"
#include "Tests/Support/TestFolder.h"

#include <QFile>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>

#include <elf.h>
#include <sys/stat.h>

namespace {

const std::vector<QByteArray> kEntryPoints = {"VSTPluginMain", "main"};

QString fixturePath(const char *kind, const char *style)
{
    return QStringLiteral(FXPROBE_EXPORT_FIXTURES "/%1-%2.so").arg(kind, style);
}

ExportAnswer ask(const QByteArray &content) { return findElfExports(OddBytes(content).view(), kEntryPoints); }

/// A library's content, with means to change it. The tables of the fixtures lie in the first segment, where
/// addresses are offsets.
struct Library {
    QByteArray content;

    explicit Library(const char *style)
    {
        QFile file(fixturePath("exported", style));
        EXPECT_TRUE(file.open(QIODevice::ReadOnly)) << qPrintable(file.fileName());
        content = file.readAll();
    }

    template <typename T>
    T &at(quint64 offset)
    {
        EXPECT_LE(offset + sizeof(T), static_cast<quint64>(content.size()));
        return *reinterpret_cast<T *>(content.data() + offset);
    }
    Elf64_Ehdr &header() { return at<Elf64_Ehdr>(0); }
    /// The n-th program header of a type.
    Elf64_Phdr &segment(quint32 type, int n = 0)
    {
        quint64 offset = header().e_phoff;
        while (at<Elf64_Phdr>(offset).p_type != type || n-- > 0)
            offset += sizeof(Elf64_Phdr);
        return at<Elf64_Phdr>(offset);
    }
    /// The dynamic section's entry.
    Elf64_Dyn &dynamic(qint64 tag)
    {
        quint64 offset = segment(PT_DYNAMIC).p_offset;
        while (at<Elf64_Dyn>(offset).d_tag != tag)
            offset += sizeof(Elf64_Dyn);
        return at<Elf64_Dyn>(offset);
    }
    void setValue(qint64 tag, quint64 value) { dynamic(tag).d_un.d_val = value; }
    void dropEntry(qint64 tag) { dynamic(tag).d_tag = DT_DEBUG; }
    /// The entry point's symbol.
    Elf64_Sym &symbol()
    {
        quint64 offset = dynamic(DT_SYMTAB).d_un.d_val;
        while (std::strcmp(&at<char>(dynamic(DT_STRTAB).d_un.d_val + at<Elf64_Sym>(offset).st_name),
                           "VSTPluginMain") != 0)
            offset += sizeof(Elf64_Sym);
        return at<Elf64_Sym>(offset);
    }
    /// Where the last loaded byte ends.
    qint64 loadedEnd()
    {
        quint64 end = 0;
        for (int n = 0; n < header().e_phnum; ++n) {
            const auto &part = at<Elf64_Phdr>(header().e_phoff + quint64(n) * sizeof(Elf64_Phdr));
            if (part.p_type == PT_LOAD)
                end = std::max<quint64>(end, part.p_offset + part.p_filesz);
        }
        return static_cast<qint64>(end);
    }
};

} // namespace

TEST(BinaryExports, AreAnsweredAsTheLibraryWasBuilt)
{
    const std::pair<const char *, ExportAnswer> kinds[] = {
        {"exported", ExportAnswer::Exported},     {"weak", ExportAnswer::Exported},
        {"protected", ExportAnswer::Exported},    {"hidden", ExportAnswer::NotExported},
        {"undefined", ExportAnswer::NotExported}, {"weakUndefined", ExportAnswer::NotExported}};
    for (const auto &[kind, expected] : kinds) {
        for (const char *style : {"sysv", "gnu", "both"}) {
            const QString path = fixturePath(kind, style);
            SCOPED_TRACE(qPrintable(path));
            EXPECT_EQ(findExports(path, kEntryPoints), expected);
            EXPECT_EQ(findExports(path, {"main", "VSTPluginMain"}), expected);
            for (const char *neighbour : {"VSTPluginA", "VSTPluginMainD", "plugB", "otherC"})
                EXPECT_EQ(findExports(path, {neighbour}), ExportAnswer::Exported) << neighbour;
            for (const char *stranger : {"", "VSTPlugi", "VSTPluginMai", "VSTPluginMainE", "main"})
                EXPECT_EQ(findExports(path, {stranger}), ExportAnswer::NotExported) << stranger;
        }
    }
}

TEST(BinaryExports, FilesThatCannotBeReadAreLeftToTheLoader)
{
    const TestFolder folder;
    folder.write(QStringLiteral("empty.so"), "");
    folder.write(QStringLiteral("text.so"), "INPUT(libc.so.6)\n");
    folder.write(QStringLiteral("pe.so"), "MZ" + QByteArray(4096, '\0'));
    ASSERT_EQ(mkfifo(QFile::encodeName(folder.path(QStringLiteral("pipe.so"))).constData(), 0600), 0);
    for (const char *name : {"empty.so", "text.so", "pe.so", "pipe.so", "missing.so", "Plugins", "/dev/zero"})
        EXPECT_EQ(findExports(folder.path(QLatin1String(name)), kEntryPoints), ExportAnswer::Unknown) << name;
    EXPECT_EQ(findElfExports(ByteView(), kEntryPoints), ExportAnswer::Unknown);
}

// What damage must not do to memory and time, the fuzz target "elf" watches.
TEST(BinaryExports, WhatIsDamagedIsLeftToTheLoader)
{
    constexpr auto kUnknown = ExportAnswer::Unknown;
    constexpr auto kExported = ExportAnswer::Exported;
    constexpr auto kNotExported = ExportAnswer::NotExported;
    const struct {
        const char *name;
        void (*apply)(Library &library);
        ExportAnswer expected;
        const char *style = "gnu";
    } rows[] = {
        {"without section headers",
         [](Library &l) { l.header().e_shoff = l.header().e_shnum = l.header().e_shstrndx = 0; }, kExported},
        {"32-bit", [](Library &l) { l.at<char>(EI_CLASS) = ELFCLASS32; }, kUnknown},
        {"other machine", [](Library &l) { l.header().e_machine = EM_AARCH64; }, kUnknown},
        {"object file", [](Library &l) { l.header().e_type = ET_REL; }, kUnknown},
        {"segment longer than the file",
         [](Library &l) { l.segment(PT_LOAD, 1).p_filesz = l.segment(PT_LOAD, 1).p_memsz = 1 << 30; },
         kUnknown},
        {"segments one over the other", [](Library &l) { l.segment(PT_LOAD, 1).p_vaddr = 0; }, kUnknown},
        {"two dynamic sections", [](Library &l) { l.segment(PT_GNU_STACK) = l.segment(PT_DYNAMIC); },
         kUnknown},
        {"other symbol size", [](Library &l) { l.setValue(DT_SYMENT, 16); }, kUnknown},
        {"names end before this one", [](Library &l) { l.setValue(DT_STRSZ, 1); }, kUnknown},
        {"look-up table nowhere, the older beside it",
         [](Library &l) { l.setValue(DT_GNU_HASH, ~quint64(0)); }, kUnknown, "both"},
        {"only the older look-up table left", [](Library &l) { l.dropEntry(DT_GNU_HASH); }, kExported,
         "both"},
        {"no look-up table", [](Library &l) { l.dropEntry(DT_GNU_HASH); }, kUnknown},
        {"no buckets", [](Library &l) { l.at<quint32>(l.dynamic(DT_GNU_HASH).d_un.d_val) = 0; }, kUnknown},
        {"no buckets in the older table",
         [](Library &l) { l.at<quint32>(l.dynamic(DT_HASH).d_un.d_val) = 0; }, kUnknown, "sysv"},
        {"all buckets there can be", [](Library &l) { l.at<quint32>(l.dynamic(DT_HASH).d_un.d_val) = ~0U; },
         kUnknown, "sysv"},
        {"name outside of the names", [](Library &l) { l.symbol().st_name = ~0U; }, kUnknown},
        {"unique binding", [](Library &l) { l.symbol().st_info = ELF64_ST_INFO(STB_GNU_UNIQUE, STT_OBJECT); },
         kExported},
        {"local binding", [](Library &l) { l.symbol().st_info = ELF64_ST_INFO(STB_LOCAL, STT_FUNC); },
         kNotExported},
        {"internal visibility", [](Library &l) { l.symbol().st_other = STV_INTERNAL; }, kNotExported},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        Library library(row.style);
        ASSERT_EQ(ask(library.content), kExported);
        row.apply(library);
        EXPECT_EQ(ask(library.content), row.expected);
    }
}

TEST(BinaryExports, ALibraryCutShortIsLeftToTheLoader)
{
    for (const char *style : {"sysv", "gnu"}) {
        Library library(style);
        for (int size = 0; size <= library.content.size(); ++size) {
            const bool isComplete = size >= library.loadedEnd();
            ASSERT_EQ(ask(library.content.left(size)),
                      isComplete ? ExportAnswer::Exported : ExportAnswer::Unknown)
                << style << ", " << size << " bytes";
        }
    }
}
