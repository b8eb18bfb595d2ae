#include "Core/BaseLib/BinaryExports.h"

#include "Tests/Core/BaseLib/Fixtures.h"
#include "Tests/Support/TestFolder.h"

#include <QDir>
#include <QFile>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <set>
#include <tuple>

#include <elf.h>
#include <sys/stat.h>

namespace {

const std::vector<QByteArray> kEntryPoints = {"VSTPluginMain", "main"};

QString fixturePath(const std::string &kind, const std::string &style)
{
    return QStringLiteral(FXPROBE_EXPORT_FIXTURES "/%1-%2.so")
        .arg(QString::fromStdString(kind), QString::fromStdString(style));
}

/// Asks with the bytes at an odd address and nothing behind them, where a sanitizer sees every step aside.
ExportAnswer ask(const QByteArray &content, const std::vector<QByteArray> &names = kEntryPoints)
{
    const auto size = static_cast<size_t>(content.size());
    const std::unique_ptr<uchar[]> bytes(new uchar[size + 1]);
    std::memcpy(bytes.get() + 1, content.constData(), size);
    return findElfExports(ByteView(bytes.get() + 1, size), names);
}

/// A library's content, with means to change it. The tables of the fixtures lie in the first segment, where
/// addresses are offsets.
struct Library {
    QByteArray content;
    qint64 hashTag; ///< of the table in which the loader looks

    explicit Library(const std::string &kind = "exported", const std::string &style = "gnu")
        : hashTag(style == "sysv" ? DT_HASH : DT_GNU_HASH)
    {
        QFile file(fixturePath(kind, style));
        EXPECT_TRUE(file.open(QIODevice::ReadOnly)) << qPrintable(file.fileName());
        content = file.readAll();
    }

    template <typename T>
    T get(quint64 offset) const
    {
        T value = {};
        EXPECT_LE(offset + sizeof(T), static_cast<quint64>(content.size()));
        std::memcpy(&value, content.constData() + offset, sizeof(T));
        return value;
    }
    template <typename T>
    void put(quint64 offset, T value)
    {
        ASSERT_LE(offset + sizeof(T), static_cast<quint64>(content.size()));
        std::memcpy(content.data() + offset, &value, sizeof(T));
    }
    /// Changes the structure T at an offset.
    template <typename T, typename Change>
    void edit(quint64 offset, Change change)
    {
        T value = get<T>(offset);
        change(value);
        put(offset, value);
    }

    Elf64_Ehdr header() const { return get<Elf64_Ehdr>(0); }
    /// Where the n-th program header of a type is.
    quint64 segment(quint32 type, int n = 0) const
    {
        quint64 offset = header().e_phoff;
        while (get<Elf64_Phdr>(offset).p_type != type || n-- > 0)
            offset += sizeof(Elf64_Phdr);
        return offset;
    }
    /// Where the dynamic section's entry is.
    quint64 dynamic(qint64 tag) const
    {
        quint64 offset = get<Elf64_Phdr>(segment(PT_DYNAMIC)).p_offset;
        while (get<Elf64_Dyn>(offset).d_tag != tag)
            offset += sizeof(Elf64_Dyn);
        return offset;
    }
    /// What the dynamic section says.
    quint64 value(qint64 tag) const { return get<Elf64_Dyn>(dynamic(tag)).d_un.d_val; }
    void setValue(qint64 tag, quint64 value) { put<quint64>(dynamic(tag) + 8, value); }
    void dropEntry(qint64 tag) { put<qint64>(dynamic(tag), DT_DEBUG); }
    /// Where the entry point's symbol is.
    quint64 symbol() const
    {
        quint64 offset = value(DT_SYMTAB);
        while (std::strcmp(content.constData() + value(DT_STRTAB) + get<Elf64_Sym>(offset).st_name,
                           "VSTPluginMain") != 0)
            offset += sizeof(Elf64_Sym);
        return offset;
    }
    /// Where the last loaded byte ends.
    qint64 loadedEnd() const
    {
        quint64 end = 0;
        for (int n = 0; n < header().e_phnum; ++n) {
            const auto part = get<Elf64_Phdr>(header().e_phoff + quint64(n) * sizeof(Elf64_Phdr));
            if (part.p_type == PT_LOAD)
                end = std::max<quint64>(end, part.p_offset + part.p_filesz);
        }
        return static_cast<qint64>(end);
    }
    /// Sets one of the 32-bit words that the look-up table is made of.
    void setHashWord(quint64 index, quint32 word) { put(value(hashTag) + 4 * index, word); }
    quint32 hashWord(quint64 index) const { return get<quint32>(value(hashTag) + 4 * index); }
};

} // namespace

class BuiltLibrary
    : public testing::TestWithParam<std::tuple<std::pair<const char *, ExportAnswer>, const char *>> {};

TEST_P(BuiltLibrary, IsAnsweredAsItWasBuilt)
{
    const auto &[kind, style] = GetParam();
    const QString path = fixturePath(kind.first, style);
    EXPECT_EQ(findExports(path, kEntryPoints), kind.second);
    EXPECT_EQ(findExports(path, {"main", "VSTPluginMain"}), kind.second);
    for (const char *neighbour : {"VSTPluginA", "VSTPluginMainD", "plugB", "otherC"})
        EXPECT_EQ(findExports(path, {neighbour}), ExportAnswer::Exported) << neighbour;
    for (const char *stranger : {"", "VSTPlugi", "VSTPluginMai", "VSTPluginMainE", "main"})
        EXPECT_EQ(findExports(path, {stranger}), ExportAnswer::NotExported) << stranger;
}

INSTANTIATE_TEST_SUITE_P(
    BinaryExports, BuiltLibrary,
    testing::Combine(testing::Values(std::pair("exported", ExportAnswer::Exported),
                                     std::pair("weak", ExportAnswer::Exported),
                                     std::pair("protected", ExportAnswer::Exported),
                                     std::pair("hidden", ExportAnswer::NotExported),
                                     std::pair("undefined", ExportAnswer::NotExported),
                                     std::pair("weakUndefined", ExportAnswer::NotExported)),
                     testing::Values("sysv", "gnu", "both")),
    [](const auto &row) { return std::string(std::get<0>(row.param).first) + "_" + std::get<1>(row.param); });

TEST(BinaryExports, InstalledPluginsHaveAnEntryPoint)
{
    const QDir folder(QStringLiteral("/usr/lib/vst"));
    const QStringList plugins = folder.entryList({QStringLiteral("*.so")}, QDir::Files);
    if (plugins.isEmpty())
        GTEST_SKIP() << "none installed";
    for (const QString &plugin : plugins) {
        EXPECT_EQ(findExports(folder.filePath(plugin), kEntryPoints), ExportAnswer::Exported)
            << qPrintable(plugin);
        EXPECT_EQ(findExports(folder.filePath(plugin), {"noSuchExport"}), ExportAnswer::NotExported)
            << qPrintable(plugin);
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

namespace {

using Change = void (*)(Library &library);
constexpr quint64 kHuge = ~quint64(0);

struct Damage {
    const char *name;
    Change apply;
    ExportAnswer expected = ExportAnswer::Unknown;
    const char *style = "gnu";
};

void editHeader(Library &library, void (*change)(Elf64_Ehdr &)) { library.edit<Elf64_Ehdr>(0, change); }

void editLoad(Library &library, int n, void (*change)(Elf64_Phdr &))
{
    library.edit<Elf64_Phdr>(library.segment(PT_LOAD, n), change);
}

void editDynamic(Library &library, void (*change)(Elf64_Phdr &))
{
    library.edit<Elf64_Phdr>(library.segment(PT_DYNAMIC), change);
}

void editSymbol(Library &library, void (*change)(Elf64_Sym &))
{
    library.edit<Elf64_Sym>(library.symbol(), change);
}

/// Every symbol that a DT_HASH table leads to is followed by itself.
void chainInCircles(Library &library)
{
    const quint32 buckets = library.hashWord(0);
    const quint32 symbols = library.hashWord(1);
    for (quint32 symbol = 1; symbol < symbols; ++symbol)
        library.setHashWord(2 + buckets + symbol, symbol);
    editSymbol(library, [](Elf64_Sym &symbol) { symbol.st_name = 0; });
}

/// No symbol that a DT_GNU_HASH table leads to is the last, up to the end of the segment.
void chainWithoutEnd(Library &library)
{
    const quint64 chains = 4 + 2 * quint64(library.hashWord(2)) + library.hashWord(0);
    editSymbol(library, [](Elf64_Sym &symbol) { symbol.st_name = 0; });
    const auto load = library.get<Elf64_Phdr>(library.segment(PT_LOAD));
    const quint64 words = (load.p_filesz - library.value(DT_GNU_HASH)) / 4 - chains;
    const Library whole = library;
    for (quint64 word = 0; word < words; ++word)
        library.put(whole.value(DT_GNU_HASH) + 4 * (chains + word), whole.hashWord(chains + word) & ~1U);
}

const Damage kHeaderDamages[] = {
    {"without section headers",
     [](Library &l) { editHeader(l, [](Elf64_Ehdr &h) { h.e_shoff = h.e_shnum = h.e_shstrndx = 0; }); },
     ExportAnswer::Exported},
    {"other magic", [](Library &l) { l.put<char>(0, 'M'); }},
    {"32-bit", [](Library &l) { l.put<char>(EI_CLASS, ELFCLASS32); }},
    {"big-endian", [](Library &l) { l.put<char>(EI_DATA, ELFDATA2MSB); }},
    {"later format", [](Library &l) { l.put<char>(EI_VERSION, 2); }},
    {"other machine", [](Library &l) { editHeader(l, [](Elf64_Ehdr &h) { h.e_machine = EM_AARCH64; }); }},
    {"object file", [](Library &l) { editHeader(l, [](Elf64_Ehdr &h) { h.e_type = ET_REL; }); }},
    {"program", [](Library &l) { editHeader(l, [](Elf64_Ehdr &h) { h.e_type = ET_EXEC; }); }},
    {"short program headers", [](Library &l) { editHeader(l, [](Elf64_Ehdr &h) { h.e_phentsize = 32; }); }},
    {"no program headers", [](Library &l) { editHeader(l, [](Elf64_Ehdr &h) { h.e_phnum = 0; }); }},
    {"program headers beyond the file",
     [](Library &l) { editHeader(l, [](Elf64_Ehdr &h) { h.e_phnum = 0xffff; }); }},
    {"program headers before the file",
     [](Library &l) { editHeader(l, [](Elf64_Ehdr &h) { h.e_phoff = kHuge - 32; }); }},
    {"segment longer than the file",
     [](Library &l) { editLoad(l, 1, [](Elf64_Phdr &p) { p.p_filesz = p.p_memsz = 1 << 30; }); }},
    {"segment wraps around in the file",
     [](Library &l) { editLoad(l, 1, [](Elf64_Phdr &p) { p.p_offset = kHuge - 8; }); }},
    {"segment wraps around in memory",
     [](Library &l) { editLoad(l, 1, [](Elf64_Phdr &p) { p.p_memsz = kHuge; }); }},
    {"segment has more in the file than in memory",
     [](Library &l) { editLoad(l, 1, [](Elf64_Phdr &p) { p.p_memsz = p.p_filesz - 1; }); }},
    {"segments one over the other", [](Library &l) { editLoad(l, 1, [](Elf64_Phdr &p) { p.p_vaddr = 0; }); }},
};

const Damage kDynamicDamages[] = {
    {"no dynamic section", [](Library &l) { editDynamic(l, [](Elf64_Phdr &p) { p.p_type = PT_NULL; }); }},
    {"two dynamic sections",
     [](Library &l) { l.put(l.segment(PT_GNU_STACK), l.get<Elf64_Phdr>(l.segment(PT_DYNAMIC))); }},
    {"dynamic section nowhere",
     [](Library &l) { editDynamic(l, [](Elf64_Phdr &p) { p.p_vaddr = 1 << 30; }); }},
    {"dynamic section without end",
     [](Library &l) { editDynamic(l, [](Elf64_Phdr &p) { p.p_filesz = 32; }); }},
    {"dynamic section longer than the file",
     [](Library &l) { editDynamic(l, [](Elf64_Phdr &p) { p.p_filesz = kHuge; }); }},
    {"no symbols", [](Library &l) { l.dropEntry(DT_SYMTAB); }},
    {"no symbol size", [](Library &l) { l.dropEntry(DT_SYMENT); }},
    {"other symbol size", [](Library &l) { l.setValue(DT_SYMENT, 16); }},
    {"no names", [](Library &l) { l.dropEntry(DT_STRTAB); }},
    {"no size of the names", [](Library &l) { l.dropEntry(DT_STRSZ); }},
    {"no look-up table", [](Library &l) { l.dropEntry(DT_GNU_HASH); }},
    {"symbols nowhere", [](Library &l) { l.setValue(DT_SYMTAB, kHuge); }},
    {"names nowhere", [](Library &l) { l.setValue(DT_STRTAB, kHuge); }},
    {"names longer than their segment", [](Library &l) { l.setValue(DT_STRSZ, kHuge); }},
    {"names end before this one", [](Library &l) { l.setValue(DT_STRSZ, 1); }},
    {"look-up table nowhere", [](Library &l) { l.setValue(DT_GNU_HASH, kHuge); }},
    {"look-up table nowhere, the older beside it", [](Library &l) { l.setValue(DT_GNU_HASH, kHuge); },
     ExportAnswer::Unknown, "both"},
    {"older look-up table nowhere", [](Library &l) { l.setValue(DT_HASH, kHuge); }, ExportAnswer::Unknown,
     "sysv"},
    {"only the older look-up table left", [](Library &l) { l.dropEntry(DT_GNU_HASH); },
     ExportAnswer::Exported, "both"},
};

const Damage kTableDamages[] = {
    {"no buckets", [](Library &l) { l.setHashWord(0, 0); }},
    {"all buckets there can be", [](Library &l) { l.setHashWord(0, ~0U); }},
    {"bucket before the first symbol", [](Library &l) { l.setHashWord(1, ~0U); }},
    {"no filter", [](Library &l) { l.setHashWord(2, 0); }},
    {"filter of odd size", [](Library &l) { l.setHashWord(2, 3); }},
    {"filter beyond the segment", [](Library &l) { l.setHashWord(2, 1U << 31); }},
    {"filter shifts everything away", [](Library &l) { l.setHashWord(3, 32); }},
    {"chain without end", chainWithoutEnd},
    {"no buckets in the older table", [](Library &l) { l.setHashWord(0, 0); }, ExportAnswer::Unknown, "sysv"},
    {"all buckets in the older table", [](Library &l) { l.setHashWord(0, ~0U); }, ExportAnswer::Unknown,
     "sysv"},
    {"no symbols in the older table", [](Library &l) { l.setHashWord(1, 1); }, ExportAnswer::Unknown, "sysv"},
    {"chain in circles", chainInCircles, ExportAnswer::Unknown, "sysv"},
    {"name outside of the names", [](Library &l) { editSymbol(l, [](Elf64_Sym &s) { s.st_name = ~0U; }); }},
    {"unique binding",
     [](Library &l) {
         editSymbol(l, [](Elf64_Sym &s) { s.st_info = ELF64_ST_INFO(STB_GNU_UNIQUE, STT_OBJECT); });
     },
     ExportAnswer::Exported},
    {"local binding",
     [](Library &l) { editSymbol(l, [](Elf64_Sym &s) { s.st_info = ELF64_ST_INFO(STB_LOCAL, STT_FUNC); }); },
     ExportAnswer::NotExported},
    {"internal visibility",
     [](Library &l) { editSymbol(l, [](Elf64_Sym &s) { s.st_other = STV_INTERNAL; }); },
     ExportAnswer::NotExported},
    {"hidden visibility", [](Library &l) { editSymbol(l, [](Elf64_Sym &s) { s.st_other = STV_HIDDEN; }); },
     ExportAnswer::NotExported},
    {"undefined", [](Library &l) { editSymbol(l, [](Elf64_Sym &s) { s.st_shndx = SHN_UNDEF; }); },
     ExportAnswer::NotExported},
};

template <size_t N>
void expectAnswers(const Damage (&damages)[N])
{
    for (const Damage &damage : damages) {
        SCOPED_TRACE(damage.name);
        Library library("exported", damage.style);
        ASSERT_EQ(ask(library.content), ExportAnswer::Exported);
        damage.apply(library);
        EXPECT_EQ(ask(library.content), damage.expected);
    }
}

/// Asks with each byte in turn set to other values, and hands the answers to the visitor.
template <typename Visitor>
void sweepBytes(QByteArray content, const std::vector<QByteArray> &names, Visitor visit)
{
    for (int position = 0; position < content.size(); ++position) {
        const char original = content.at(position);
        for (const char value : {'\0', '\xff', char(~original)}) {
            content[position] = value;
            visit(position, ask(content, names));
        }
        content[position] = original;
    }
}

} // namespace

TEST(BinaryExports, HeadersAreChecked) { expectAnswers(kHeaderDamages); }

TEST(BinaryExports, DynamicSectionIsChecked) { expectAnswers(kDynamicDamages); }

TEST(BinaryExports, LookUpTablesAreChecked) { expectAnswers(kTableDamages); }

TEST(BinaryExports, ALibraryCutShortIsLeftToTheLoader)
{
    for (const char *style : {"sysv", "gnu"}) {
        const Library library("exported", style);
        for (int size = 0; size <= library.content.size(); ++size) {
            const bool isComplete = size >= library.loadedEnd();
            ASSERT_EQ(ask(library.content.left(size)),
                      isComplete ? ExportAnswer::Exported : ExportAnswer::Unknown)
                << style << ", " << size << " bytes";
        }
    }
}

TEST(BinaryExports, DamageNeverMakesAnExport)
{
    for (const char *style : {"sysv", "gnu", "both"}) {
        const Library library("exported", style);
        sweepBytes(library.content, {"GetPluginFactory"}, [&](int position, ExportAnswer answer) {
            ASSERT_NE(answer, ExportAnswer::Exported) << style << ", byte " << position;
        });
    }
}

TEST(BinaryExports, DamageBehindTheTablesChangesNothing)
{
    for (const char *style : {"sysv", "gnu", "both"}) {
        const Library library("exported", style);
        std::set<ExportAnswer> seen;
        sweepBytes(library.content, kEntryPoints, [&](int position, ExportAnswer answer) {
            seen.insert(answer);
            if (position >= library.loadedEnd()) {
                ASSERT_EQ(answer, ExportAnswer::Exported) << style << ", byte " << position;
            }
        });
        EXPECT_EQ(seen.size(), 3U) << style << ": the damage did not reach what is read";
    }
}
