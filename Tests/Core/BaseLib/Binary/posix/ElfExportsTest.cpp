#include "Core/BaseLib/Binary/PluginLibrary.h"
#include "Core/BaseLib/Binary/posix/ElfTables.h"

#include "Tests/Core/BaseLib/Binary/CorpusFile.h"
#include "Tests/Support/TestFolder.h"

#include <cstddef>

#include <elf.h>
#include <sys/stat.h>

#include <gtest/gtest.h>

namespace {

using Answer = ExportAnswer;
const std::vector<QByteArray> kEntryPoints = {"main", "VSTPluginMain"};

Answer ask(CorpusFile &file) { return findElfExports(file.view(), kEntryPoints); }

// Where things are in the two libraries that are damaged.
constexpr int kSegments = 0x40;
constexpr int kDynamic = 0x490;    ///< its first entry leads to the look-up table
constexpr int kSymbolSize = 0x4d8; ///< value of its fifth entry
constexpr int kLookUp = 0x158;
constexpr int kGnuSymbol = 0x2f0; ///< of "VSTPluginMain"
constexpr int kLoadedEnd = 0x540; ///< section headers and the like follow

} // namespace

TEST(ElfExports, AreFoundByEitherTable)
{
    const std::pair<const char *, Answer> rows[] = {{"elf/exported-gnu", Answer::Exported},
                                                    {"elf/exported-sysv", Answer::Exported},
                                                    {"elf/undefined-gnu", Answer::NotExported},
                                                    {"elf/not-exported-sysv", Answer::NotExported}};
    for (const auto &[name, expected] : rows) {
        EXPECT_EQ(findExports(corpusPath(name), kEntryPoints), expected) << name;
        for (const char *neighbour : {"VSTPluginA", "VSTPluginMainD", "plugB", "otherC"})
            EXPECT_EQ(findExports(corpusPath(name), {neighbour}), Answer::Exported) << name << neighbour;
        for (const char *other : {"", "VSTPlugi", "VSTPluginMai", "VSTPluginMainE", "main"})
            EXPECT_EQ(findExports(corpusPath(name), {other}), Answer::NotExported) << name << other;
    }
}

// What damage must not do to memory and time, the fuzz target "elf" watches.
TEST(ElfExports, ADamagedLibraryIsLeftToTheLoader)
{
    const struct {
        const char *name;
        int offset, width;
        quint64 value;
        Answer expected = Answer::Unknown;
        const char *file = "elf/exported-gnu";
    } rows[] = {
        {"nothing", 0, 1, 0x7f, Answer::Exported},
        {"other machine", offsetof(Elf64_Ehdr, e_machine), 2, EM_AARCH64},
        {"object file", offsetof(Elf64_Ehdr, e_type), 2, ET_REL},
        {"segment longer than the file", kSegments + offsetof(Elf64_Phdr, p_filesz), 8, 1 << 30},
        {"segments one over the other", kSegments + 56 + offsetof(Elf64_Phdr, p_vaddr), 8, 0},
        {"two dynamic sections", kSegments + 4 * 56, 4, PT_DYNAMIC},
        {"other symbol size", kSymbolSize, 8, 16},
        {"look-up table nowhere", kDynamic + 8, 8, ~quint64(0)},
        {"no look-up table", kDynamic, 8, DT_DEBUG},
        {"no buckets", kLookUp, 4, 0},
        {"no buckets in the older table", kLookUp, 4, 0, Answer::Unknown, "elf/exported-sysv"},
        {"all buckets there can be", kLookUp, 4, ~0U, Answer::Unknown, "elf/exported-sysv"},
        {"name outside of the names", kGnuSymbol, 4, ~0U},
        {"local symbol", kGnuSymbol + 4, 1, ELF64_ST_INFO(STB_LOCAL, STT_FUNC), Answer::NotExported},
        {"protected symbol", kGnuSymbol + 5, 1, STV_PROTECTED, Answer::Exported},
        {"hidden symbol", kGnuSymbol + 5, 1, STV_HIDDEN, Answer::NotExported},
        {"symbol of another library", kGnuSymbol + 6, 2, SHN_UNDEF, Answer::NotExported},
    };
    for (const auto &row : rows) {
        CorpusFile file(row.file);
        file.put(row.offset, row.width, row.value);
        EXPECT_EQ(ask(file), row.expected) << row.name;
    }
    for (CorpusFile part("elf/exported-gnu"); !part.content.isEmpty(); part.content.chop(1))
        ASSERT_EQ(ask(part), part.content.size() >= kLoadedEnd ? Answer::Exported : Answer::Unknown)
            << part.content.size() << " bytes";
}

TEST(ElfExports, WhatHasNoEndOrNoContentIsLeftToTheLoader)
{
    const TestFolder folder;
    ASSERT_EQ(mkfifo(qPrintable(folder.path("pipe.so")), 0600), 0);
    for (const char *name : {"pipe.so", "missing.so", "Plugins", "/dev/zero"})
        EXPECT_EQ(findExports(folder.path(name), kEntryPoints), Answer::Unknown) << name;
}

TEST(PluginLibrary, NamesTheLibrariesThatAreMissing)
{
    const TestFolder folder;
    const QString path = folder.path("needs-two.so"), beside = "lib/libgone.so.1";
    ASSERT_TRUE(QFile::copy(corpusPath("elf/needs-two"), path));
    PluginLibrary library;
    EXPECT_FALSE(library.load(path));
    EXPECT_EQ(library.errorText(), "it needs libgone.so.1 and libaway.so.2, which are not installed");
    folder.write(beside, "a text");
    EXPECT_FALSE(library.load(path));
    EXPECT_EQ(library.errorText(), "it needs libaway.so.2, which is not installed");
    folder.write("lib/libaway.so.2", folder.read(path));
    EXPECT_FALSE(library.load(path));
    EXPECT_EQ(library.errorText(), "it needs libgone.so.1, which is not a program library");
    folder.write("Elsewhere/libgone.so.1", {});
    const QString link = folder.path("Elsewhere/link.so");
    EXPECT_TRUE(PluginLibrary::inspect(path).isLoadable() && QFile::link(path, link) && !library.load(link));
    EXPECT_EQ(library.errorText(), "it needs libgone.so.1 and libaway.so.2, which are not installed")
        << "it names folders beside it, and not beside its file";
    folder.write(beside, folder.read(path).left(1000));
    EXPECT_EQ(PluginLibrary::inspect(path).verdict, ModuleInspection::Verdict::CutShort);
    EXPECT_TRUE(
        PluginLibrary::inspect(path).reason.startsWith("it needs libgone.so.1, which is cut short: 1000 of"));
}

TEST(PluginLibrary, NamesWhatALibraryThatIsThereLacks)
{
    const TestFolder folder;
    QFile file(ONE_FUNCTION_LIBRARY);
    ASSERT_TRUE(file.open(QIODevice::ReadOnly));
    const QByteArray whole = file.readAll();
    const struct {
        QByteArray name, other;
        QString lack;
    } rows[] = {
        {"GLIBC_2.2.5", "GLIBC_9.9.9", "version GLIBC_9.9.9 of libc.so.6, which is not installed"},
        {"getenv", "_Z2gov", "the symbol \"go()\", which none of its libraries has"},
    };
    for (const auto &row : rows) {
        folder.write("x.so", QByteArray(whole).replace(row.name, row.other));
        PluginLibrary library;
        EXPECT_FALSE(library.load(folder.path("x.so")));
        EXPECT_EQ(library.errorText(), "it needs " + row.lack);
    }
}
