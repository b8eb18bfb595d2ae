#include "Core/BaseLib/Binary/PeImage.h"
#include "Core/BaseLib/Binary/LoadFailure.h"
#include "Core/BaseLib/Binary/ModuleFile.h"

#include "Tests/Core/BaseLib/Binary/CorpusFile.h"
#include "Tests/Support/TestFolder.h"

#include <gtest/gtest.h>

namespace {

using Answer = ExportAnswer;
const std::vector<QByteArray> kEntryPoints = {"VSTPluginMain", "main"};

Answer exportsOf(CorpusFile &file) { return findPeExports(file.view(), kEntryPoints); }

/// The imported libraries, the late ones behind a bar; "?" for an unreadable table.
QString librariesOf(CorpusFile &file)
{
    const std::optional<PeImage> image = PeImage::read(file.view());
    const auto text = [](const std::optional<QStringList> &names) { return names ? names->join(' ') : "?"; };
    return image ? text(image->imports()) + '|' + text(image->delayImports()) : "?|?";
}

constexpr char kImports[] = "KERNEL32.dll missing.dll plug.dll|USER32.dll";
constexpr char kOnlyLate[] = "|USER32.dll";
// Where things are in the file that is damaged, which is loaded at 0x1000 from 0x200 on.
constexpr int kOptionalHeader = 0x58;
constexpr int kDirectoryCount = kOptionalHeader + 108;
constexpr int kDirectories = kDirectoryCount + 4;
constexpr int kSection = kDirectories + 16 * 8;
constexpr int kExports = 0x200;
constexpr int kFirstImport = 0x250;

} // namespace

TEST(PeImage, TablesAreReadAndChecked)
{
    const struct {
        const char *name;
        int offset, width;
        quint32 value;
        Answer exports = Answer::Unknown;
        const char *libraries = "?|?";
    } rows[] = {
        {"nothing", 0, 1, 'M', Answer::Exported, kImports},
        {"no PE magic", 0x40, 1, 'N'},
        {"laid out as a driver", kOptionalHeader + 32, 4, 512},
        {"no directories", kDirectoryCount, 4, 0, Answer::NotExported, "|"},
        {"section of no size in memory", kSection + 8, 4, 0, Answer::Exported, kImports},
        {"section wraps around", kSection + 16, 4, ~0U},
        {"exports nowhere", kDirectories, 4, ~0U, Answer::Unknown, kImports},
        {"name of a function that there is not", kExports + 20, 4, 0, Answer::Unknown, kImports},
        {"more names than indexes reach", kExports + 24, 4, ~0U, Answer::Unknown, kImports},
        {"function at address zero", kExports + 28, 4, 0x1000, Answer::NotExported, kImports},
        {"imports nowhere", kDirectories + 8, 4, ~0U, Answer::Exported, "?|USER32.dll"},
        {"imports end with a missing name", kFirstImport + 12, 4, 0, Answer::Exported, kOnlyLate},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        CorpusFile file("pe/64-bit.dll");
        file.put(row.offset, row.width, row.value);
        EXPECT_EQ(exportsOf(file), row.exports);
        EXPECT_EQ(librariesOf(file), row.libraries);
    }
    CorpusFile part("pe/64-bit.dll");
    while (!part.content.isEmpty()) {
        part.content.chop(1);
        ASSERT_EQ(exportsOf(part), Answer::Unknown) << part.content.size() << " bytes";
        ASSERT_EQ(librariesOf(part), "?|?") << part.content.size() << " bytes";
    }
}

TEST(PeImage, ExportsOfEachMachineAreFound)
{
    for (const char *name : {"pe/64-bit.dll", "pe/32-bit.dll", "pe/arm64.dll"}) {
        EXPECT_EQ(findExports(corpusPath(name), kEntryPoints), Answer::Exported) << name;
        EXPECT_EQ(findExports(corpusPath(name), {"VSTPluginMai", "main"}), Answer::NotExported) << name;
    }
    EXPECT_EQ(findExports(ONE_FUNCTION_LIBRARY, {"answer"}), Answer::Exported) << "this system's";
    EXPECT_EQ(findExports(ONE_FUNCTION_LIBRARY, kEntryPoints), Answer::NotExported) << "this system's";
}

TEST(LoadFailure, NamesWhatKeepsALibraryFromLoading)
{
    const QString own =
        kOwnForm == LibraryForm::Pe
            ? ""
            : "it needs plug.dll, which is built for Windows; this machine needs one for Linux";
    const struct {
        const char *name;
        QString library;
        QString missing, plug; ///< what is found under these names
        QString reason;
    } rows[] = {
        {"needs itself", "pe/64-bit.dll", "", "pe/64-bit.dll", own},
        {"one is missing", "pe/64-bit.dll", "none", "", "it needs missing.dll, which is not installed"},
        {"two are missing", "pe/64-bit.dll", "none", "none",
         "it needs missing.dll and plug.dll, which are not installed"},
        {"needs what is cut short", "pe/64-bit.dll", "", "pe/cut-short.dll",
         "it needs plug.dll, which is cut short: "},
        {"needs a text", "pe/64-bit.dll", "scanlist/folders.xml", "none",
         "it needs plug.dll, which is not installed"},
        {"not there: the loader says so", "pe/none", "none", "none", ""},
    };
    for (const auto &row : rows) {
        const auto search = [&](const QString &name, const QString &) -> std::optional<QString> {
            const QString found = name == "missing.dll" ? row.missing : name == "plug.dll" ? row.plug : "";
            if (found == "none")
                return std::nullopt;
            return found.isEmpty() ? found : corpusPath(found);
        };
        const QString reason = whyNotLoadable(corpusPath(row.library), search);
        EXPECT_EQ(reason.left(row.reason.size()), row.reason) << row.name;
        EXPECT_EQ(reason.isEmpty(), row.reason.isEmpty()) << row.name << ": " << qPrintable(reason);
    }
}

TEST(ModuleFile, TellsBeforeLoadingWhatCannotBeLoaded)
{
    using Is = ModuleInspection::Verdict;
    const struct {
        const char *name, *file;
        int offset, width;
        quint64 value;
        Is ofElf, ofPe; ///< where these are the system's own
    } rows[] = {
        {"ELF", "elf/exported-gnu", 0, 1, 0x7f, Is::Loadable, Is::Foreign},
        {"ELF of 32 bits, all headers there", "elf/exported-gnu", 4, 1, 1, Is::Loadable, Is::Foreign},
        {"ELF for ARM", "elf/exported-gnu", 18, 2, 183, Is::Foreign, Is::Foreign},
        {"ELF of the other byte order", "elf/exported-gnu", 5, 1, 2, Is::Loadable, Is::Foreign},
        {"segment behind the end", "elf/exported-gnu", 0x40 + 32, 8, 1 << 30, Is::CutShort, Is::CutShort},
        {"segment that wraps around", "elf/exported-gnu", 0x40 + 32, 8, ~0ULL, Is::CutShort, Is::CutShort},
        {"section headers behind the end", "elf/exported-gnu", 40, 8, 1 << 30, Is::CutShort, Is::CutShort},
        {"ELF magic that is none", "elf/exported-gnu", 1, 1, 'e', Is::NoLibrary, Is::NoLibrary},
        {"PE", "pe/64-bit.dll", 0, 1, 'M', Is::Foreign, Is::Loadable},
        {"PE of 32 bits", "pe/32-bit.dll", 0, 1, 'M', Is::Foreign, Is::Foreign},
        {"section behind the end", "pe/64-bit.dll", kSection + 16, 4, ~0U, Is::CutShort, Is::CutShort},
        {"program of DOS", "pe/64-bit.dll", 0x40, 1, 'N', Is::NoLibrary, Is::NoLibrary},
    };
    for (const auto &row : rows) {
        CorpusFile file(row.file);
        file.put(row.offset, row.width, row.value);
        const ModuleInspection seen = inspectContent(file.view());
        EXPECT_EQ(seen.verdict, kOwnForm == LibraryForm::Elf ? row.ofElf : row.ofPe) << row.name;
        EXPECT_EQ(seen.reason.isEmpty(), seen.verdict == Is::Loadable) << row.name;
    }
    CorpusFile arm("elf/exported-gnu");
    arm.put(18, 2, 183);
    const QString needed =
        kOwnForm == LibraryForm::Elf ? "64-bit ARM; this machine needs 64-bit x86" : "Linux";
    EXPECT_TRUE(inspectContent(arm.view()).reason.startsWith("it is built for " + needed));
    for (const char *name : {"elf/exported-gnu", "elf/needs-two", "pe/64-bit.dll", "pe/32-bit.dll"})
        for (CorpusFile part(name); !part.content.isEmpty();) {
            part.content.chop(1);
            ASSERT_EQ(inspectContent(part.view()).verdict, Is::CutShort)
                << name << ", " << part.content.size() << " bytes";
        }
    const int header = 64; // bytes, of the file and of a section
    CorpusFile blank("elf/needs-two");
    for (int from = blank.content.size() - header; from >= header; --from) {
        const int size = blank.content.size() - from;
        blank.content.replace(from, size, QByteArray(size, '\0'));
        ASSERT_EQ(inspectContent(blank.view()).verdict, Is::CutShort) << "zeros from " << from;
    }
}
