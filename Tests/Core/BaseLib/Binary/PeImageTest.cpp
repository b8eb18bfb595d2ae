#include "Core/BaseLib/Binary/PeImage.h"
#include "Core/BaseLib/Binary/LoadFailure.h"

#include "Tests/Core/BaseLib/Binary/PeBuilder.h"
#include "Tests/Core/BaseLib/Files/Fixtures.h"

#include <gtest/gtest.h>

namespace {

using Answer = ExportAnswer;
const std::vector<QByteArray> kEntryPoints = {"VSTPluginMain", "main"};
const PeContent kPlugin = {{"alpha", "main", "omega"}, {"KERNEL32.dll", "drums.dll"}, {"late.dll"}};

/// What is read from an image.
struct Reading {
    OddBytes bytes;
    std::optional<PeImage> image;

    explicit Reading(const QByteArray &content)
        : bytes(content)
        , image(PeImage::read(bytes.view()))
    {}
    Answer exports(const std::vector<QByteArray> &names = kEntryPoints) const
    {
        return image ? image->findExports(names) : Answer::Unknown;
    }
    /// The imported libraries, the late ones behind a bar; "?" for an unreadable table.
    QString libraries() const
    {
        const auto text = [](const std::optional<QStringList> &names) {
            return names ? names->join(QLatin1Char(' ')) : QStringLiteral("?");
        };
        return image ? text(image->imports()) + '|' + text(image->delayImports()) : "?|?"_q;
    }
};

const QString kAllLibraries = "KERNEL32.dll drums.dll|late.dll"_q;

/// An image changed at one place.
struct Damage {
    const char *name;
    int offset;
    int width;
    quint32 value;
    Answer exports = Answer::Unknown;
    QString libraries = "?|?"_q;
};

using namespace PePlace;
constexpr int kImports = kTables + 40 + 3 * 10 + 17;       // behind three exports and their names
constexpr int kDelayImports = kImports + 3 * 20 + 13 + 10; // behind two imports and their names

const Damage kDamages[] = {
    {"nothing", 0, 1, 'M', Answer::Exported, kAllLibraries},
    {"without the PE magic", 0x40, 1, 'N'},
    {"neither 32-bit nor 64-bit", kOptionalHeader, 2, 0x107},
    {"optional header up to the directories", kOptionalHeaderSize, 2, 112},
    {"laid out as a driver", kSectionAlignment, 4, 512},
    {"no directories", kDirectoryCount, 4, 0, Answer::NotExported, "|"_q},
    {"directories up to the imports", kDirectoryCount, 4, 2, Answer::Exported, "KERNEL32.dll drums.dll|"_q},
    {"section of no size in memory", kSection + 8, 4, 0, Answer::Exported, kAllLibraries},
    {"section ends with its page", kSection + 8, 4, 1, Answer::Exported, kAllLibraries},
    {"section wraps around", kSection + 16, 4, ~0U},
    {"exports nowhere", kDirectories, 4, ~0U, Answer::Unknown, kAllLibraries},
    {"no functions", kFunctionCount, 4, 0, Answer::Unknown, kAllLibraries},
    {"names up to the one before", kNameCount, 4, 1, Answer::NotExported, kAllLibraries},
    {"all names there can be", kNameCount, 4, ~0U, Answer::Unknown, kAllLibraries},
    {"functions at zeros", kFunctionTable, 4, 0x1000, Answer::NotExported, kAllLibraries},
    {"names nowhere", kNameTable, 4, 0x8000, Answer::Unknown, kAllLibraries},
    {"imports nowhere", kDirectories + 8, 4, ~0U, Answer::Exported, "?|late.dll"_q},
    {"no imports", kDirectories + 8, 4, 0, Answer::Exported, "|late.dll"_q},
    {"imports end with a missing name", kImports + 12, 4, 0, Answer::Exported, "|late.dll"_q},
    {"late imports of the last century", kDelayImports, 4, 0, Answer::Exported, "KERNEL32.dll drums.dll|?"_q},
    {"late imports by the names of the others", kDirectories + 104, 4, 0x1000, Answer::Exported,
     "KERNEL32.dll drums.dll|"_q},
};

} // namespace

TEST(PeImage, TablesAreReadAndChecked)
{
    for (const Damage &damage : kDamages) {
        SCOPED_TRACE(damage.name);
        QByteArray content = PeBuilder(kPlugin).build();
        PeBuilder::put(content, damage.offset, damage.width, damage.value);
        const Reading reading(content);
        EXPECT_EQ(reading.exports(), damage.exports);
        EXPECT_EQ(reading.libraries(), damage.libraries);
    }
}

TEST(PeImage, AnImageCutShortIsLeftToTheLoader)
{
    const QByteArray content = PeBuilder(kPlugin).build();
    for (int size = 0; size < content.size(); ++size) {
        const Reading reading(content.left(size));
        ASSERT_EQ(reading.exports(), Answer::Unknown) << size << " bytes";
        ASSERT_EQ(reading.libraries(), "?|?"_q) << size << " bytes";
    }
}

TEST(PeImage, AnyMachinesExportsCount)
{
    const struct {
        const char *name;
        PeContent content;
        Answer expected;
    } rows[] = {
        {"ours", {{"VSTPluginMain"}, {}, {}}, Answer::Exported},
        {"32-bit x86", {{"VSTPluginMain"}, {"a.dll"}, {}, 0x014c, false}, Answer::Exported},
        {"ARM64, older entry point", {{"x", "main"}, {}, {}, 0xaa64}, Answer::Exported},
        {"32-bit x86, no entry point", {{"mainly", "mai", ""}, {}, {}, 0x014c, false}, Answer::NotExported},
        {"no exports", {}, Answer::NotExported},
        {"as many exports as there can be",
         {std::vector<QByteArray>(1 << 16, "x"), {}, {}},
         Answer::NotExported},
        {"more exports than there can be",
         {std::vector<QByteArray>((1 << 16) + 1, "x"), {}, {}},
         Answer::Unknown},
    };
    const EmptyFolder folder;
    for (const auto &row : rows) {
        const QString path = folder.write("some.dll"_q, PeBuilder(row.content).build());
        EXPECT_EQ(findExports(path, kEntryPoints), row.expected) << row.name;
    }
    EXPECT_EQ(findExports(ONE_FUNCTION_LIBRARY, {"countUnloading"}), Answer::Exported) << "this system's";
    EXPECT_EQ(findExports(ONE_FUNCTION_LIBRARY, kEntryPoints), Answer::NotExported) << "this system's";
}

TEST(LoadFailure, NamesWhatKeepsALibraryFromLoading)
{
    const EmptyFolder folder;
    const auto add = [&](const char *name, const PeContent &content) {
        folder.write(name, PeBuilder(content).build());
    };
    // Finds what was written, and the system's "KERNEL32.dll".
    const auto search = [&](const QString &name) {
        const bool isSystems = name == "KERNEL32.dll";
        return isSystems || QFile::exists(folder.path(name))
                   ? std::make_optional(isSystems ? QString() : folder.path(name))
                   : std::nullopt;
    };
    add("ring1.dll", {{}, {"KERNEL32.dll", "RING2.dll"}, {}});
    add("RING2.dll", {{}, {"ring1.dll", "ring2.DLL"}, {}});
    add("old.dll", {{}, {}, {}, 0x014c, false});
    add("lacking.dll", {{}, {"ring1.dll", "gone.dll"}, {}});
    folder.write("empty.dll"_q);
    folder.write("text.dll"_q, "text");
    folder.write("short.dll"_q, PeBuilder(kPlugin).build().left(600));
    const struct {
        const char *name;
        PeContent content;
        const char *reason;
    } rows[] = {
        {"nothing wrong, and imports in circles", {{}, {"KERNEL32.dll", "ring1.dll"}, {}}, ""},
        {"late imports do not matter", {{}, {}, {"gone.dll"}}, ""},
        {"32-bit x86", {{}, {"gone.dll"}, {}, 0x014c, false}, "is built for 32-bit x86"},
        {"32-bit ARM", {{}, {}, {}, 0x01c4, false}, "is built for 32-bit ARM"},
        {"ARM64", {{}, {}, {}, 0xaa64}, "is built for 64-bit ARM"},
        {"unheard of", {{}, {}, {}, 0x0bad}, "is built for another machine (type 0x0BAD)"},
        {"missing", {{}, {"ring1.dll", "gone.dll", "x.dll"}, {}}, "needs gone.dll, which is not found"},
        {"missing one level down",
         {{}, {"lacking.dll"}, {}},
         "needs lacking.dll, which needs gone.dll, which is not found"},
        {"needs another machine's", {{}, {"old.dll"}, {}}, "needs old.dll, which is built for 32-bit x86"},
        {"needs a text", {{}, {"text.dll"}, {}}, "needs text.dll, which is not a Windows library"},
        {"needs a part", {{}, {"short.dll"}, {}}, "needs short.dll, which is cut short or damaged"},
        {"the loader knows about an empty file", {{}, {"empty.dll"}, {}}, ""},
    };
    for (const auto &row : rows) {
        const QString path = folder.write("plugin.dll"_q, PeBuilder(row.content).build());
        EXPECT_EQ(whyNotLoadable(path, search), QLatin1String(row.reason)) << row.name;
    }
    EXPECT_EQ(whyNotLoadable("missing.dll"_q, search), QString());
}
