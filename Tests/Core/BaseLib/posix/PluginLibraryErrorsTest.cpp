#include "Core/BaseLib/PluginLibrary.h"

#include "Tests/Core/BaseLib/Fixtures.h"

#include <cstring>

#include <elf.h>

#include <gtest/gtest.h>

namespace {

QByteArray elfHeader(unsigned char elfClass, Elf64_Half machine)
{
    Elf64_Ehdr header = {};
    std::memcpy(header.e_ident, ELFMAG, SELFMAG);
    header.e_ident[EI_CLASS] = elfClass;
    header.e_ident[EI_DATA] = ELFDATA2LSB;
    header.e_ident[EI_VERSION] = EV_CURRENT;
    header.e_type = ET_DYN;
    header.e_machine = machine;
    header.e_version = EV_CURRENT;
    header.e_phentsize = sizeof(Elf64_Phdr);
    return QByteArray(reinterpret_cast<const char *>(&header), sizeof(header)) + QByteArray(4096, '\0');
}

} // namespace

TEST(PluginLibraryErrors, KeepTheLoadersOwnWords)
{
    const EmptyFolder folder;
    const struct {
        const char *name;
        QString path;
        const char *words;
    } rows[] = {
        {"text", folder.write("text.vst3"_q, QByteArray(100, 'x')), "invalid ELF header"},
        {"empty", folder.write("empty.vst3"_q), "file too short"},
        {"cut off", folder.write("cut.vst3"_q, elfHeader(ELFCLASS64, EM_X86_64).left(40)), "file too short"},
        {"missing", folder.path("残響.vst3"_q),
         "残響.vst3: cannot open shared object file: No such file or directory"},
        {"a folder", folder.path(), "Is a directory"},
        {"lacks a function", QStringLiteral(MISSING_FUNCTION_LIBRARY),
         "undefined symbol: functionThatNobodyHas"},
        {"32 bits", folder.write("old.vst3"_q, elfHeader(ELFCLASS32, EM_386)),
         "wrong ELF class: ELFCLASS32 (the file is built for 32-bit x86)"},
        {"other machine", folder.write("arm.vst3"_q, elfHeader(ELFCLASS64, EM_AARCH64)),
         "No such file or directory (the file is built for 64-bit ARM)"},
        {"no path", QString(), "no path given"},
    };
    for (const auto &row : rows) {
        PluginLibrary library;
        EXPECT_FALSE(library.load(row.path)) << row.name;
        EXPECT_FALSE(library.isLoaded()) << row.name;
        EXPECT_TRUE(library.errorText().endsWith(QString::fromUtf8(row.words)))
            << row.name << ": " << library.errorText().toStdString();
        EXPECT_TRUE(library.errorText().contains(row.path)) << row.name;
    }
}
