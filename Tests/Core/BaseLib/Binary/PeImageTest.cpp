#include "Core/BaseLib/Binary/PeImage.h"
#include "Core/BaseLib/Binary/LoadFailure.h"

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
    const struct {
        const char *name;
        QString library;
        QString imported; ///< found as "missing.dll"; none when empty
        const char *reason;
    } rows[] = {
        {"nothing wrong, and imports in circles", "pe/64-bit.dll", "pe/64-bit.dll", ""},
        {"other machine", "pe/32-bit.dll", "", "is built for 32-bit x86"},
        {"missing", "pe/64-bit.dll", "", "needs missing.dll, which is not found"},
        {"needs another machine's", "pe/64-bit.dll", "pe/arm64.dll",
         "needs missing.dll, which is built for 64-bit ARM"},
        {"needs another system's", "pe/64-bit.dll", "elf/exported-gnu",
         "needs missing.dll, which is not a Windows library"},
        {"needs a part of one", "pe/64-bit.dll", "pe/cut-short.dll",
         "needs missing.dll, which is cut short or damaged"},
        {"not there: the loader says so", "pe/none", "", ""},
    };
    for (const auto &row : rows) {
        const auto search = [&](const QString &name) -> std::optional<QString> {
            if (name != "missing.dll")
                return QString(); // known to load
            return row.imported.isEmpty() ? std::nullopt : std::make_optional(corpusPath(row.imported));
        };
        EXPECT_EQ(whyNotLoadable(corpusPath(row.library), search), row.reason) << row.name;
    }
}
