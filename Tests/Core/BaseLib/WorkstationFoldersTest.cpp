#include "Core/BaseLib/WorkstationFolders.h"

#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

#include <set>
#include <string>

using namespace WorkstationFolders;

namespace {

QString text(const wchar_t *result) { return QString::fromWCharArray(result); }

class WorkstationFoldersTest : public testing::Test {
protected:
    ~WorkstationFoldersTest() override
    {
        setSystemFolder(nullptr);
        setInstallRoot(nullptr);
        setShadersOverride(false);
    }
};

} // namespace

TEST_F(WorkstationFoldersTest, EveryGetter)
{
    const struct {
        Folder folder;
        const char *path;
        bool isScratch;
    } rows[] = {{Folder::Debug, "W\\Debug", false},
                {Folder::Undo, "W\\Undo", false},
                {Folder::Media, "W\\Media", false},
                {Folder::Meters, "W\\Meters", false},
                {Folder::Temp, "W\\Temp", false},
                {Folder::DeviceInfo, "W\\DeviceInfo", false},
                {Folder::MXFIndexedFiles, "W\\MXF_Indexed_Files", true},
                {Folder::TemplateRamps, "W\\Template Ramps", false},
                {Folder::VideoStream, "W\\VideoStream", false},
                {Folder::WorkRoot, "W", false},
                {Folder::Macros, "P/\\Macros", false},
                {Folder::Dissolves, "P/\\Dissolves", false},
                {Folder::EQPresets, "P/\\EQ Presets", true},
                {Folder::FXPresets, "P/\\FX Presets", true},
                {Folder::FadePresets, "P/\\Fade Presets", true},
                {Folder::UserMachines, "P/\\Machines", false},
                {Folder::EdlConfig, "P/\\EdlConfig", true},
                {Folder::CapturePreset, "P/\\CapturePreset", false},
                {Folder::PresetRoot, "P/", false},
                {Folder::Effects, "C:\\Data\\Effects", false},
                {Folder::VSTPlugins, "C:\\Data\\Effects\\VSTPlugins", false},
                {Folder::Pictures, "C:\\Data\\Pictures", false},
                {Folder::FileFormatPlugins, "C:\\Data\\FileFormatPlugins", false},
                {Folder::SystemMachines, "C:\\Data\\Machines", false},
                {Folder::Shaders, "C:\\Data\\Shaders", true},
                {Folder::SystemRoot, "C:\\Data", false}};
    setSystemFolder(L"C:\\Data\\\\/");
    EXPECT_EQ(text(auxFolder()), QStringLiteral("C:\\Data"));
    EXPECT_EQ(setWorkFolder(L"W") + setPresetFolder(L"P/") + setAuxFolder(L"A"), 0);
    EXPECT_EQ(text(themesFolder()), QStringLiteral("C:\\Data\\Themes"));
    EXPECT_EQ(text(auxFolder()), QStringLiteral("A"));
    std::set<const wchar_t *> buffers;
    for (const bool isOverridden : {false, true}) {
        setShadersOverride(isOverridden);
        for (const auto &row : rows) {
            EXPECT_EQ(text(folderPath(row.folder, L"FX.xml")), QLatin1String(row.path) + "\\FX.xml");
            const wchar_t *const result = folderPath(row.folder);
            EXPECT_EQ(text(result), QLatin1String(row.path));
            EXPECT_EQ(result != folderPath(row.folder), row.isScratch) << row.path;
            EXPECT_EQ(text(folderPath(row.folder, folderPath(row.folder))),
                      QLatin1String(row.path) + '\\' + row.path);
            buffers.insert(row.isScratch ? nullptr : result);
        }
    }
    EXPECT_EQ(buffers.size(), 21u) << "each its own, and the pool";
}

TEST_F(WorkstationFoldersTest, RootsAreStrippedAndCut)
{
    const std::wstring longest(259, L'x');
    const struct {
        const char *name;
        std::wstring system;
        std::wstring root;
        std::wstring debug;
    } rows[] = {{"unset", L"", L"", L"\\Debug"},
                {"separators only", L"\\/\\", L"", L"\\Debug"},
                {"as long as can be", longest, longest, longest},
                {"longer", longest + L"yz", longest, longest},
                {"separators where it is cut", std::wstring(258, L'x') + L"\\\\y", std::wstring(258, L'x'),
                 std::wstring(258, L'x') + L"\\"},
                {"half a character where it is cut",
                 std::wstring(258, L'x') + wchar_t(0xD83D) + wchar_t(0xDE00), std::wstring(258, L'x'),
                 std::wstring(258, L'x') + L"\\"}};
    for (const auto &row : rows) {
        setSystemFolder(row.system.c_str());
        EXPECT_EQ(text(folderPath(Folder::SystemRoot)), QString::fromStdWString(row.root)) << row.name;
        EXPECT_EQ(text(folderPath(Folder::Debug)), QString::fromStdWString(row.debug)) << row.name;
    }
    wchar_t unterminated[259];
    std::fill(std::begin(unterminated), std::end(unterminated), L'u');
    setWorkFolder(unterminated);
    EXPECT_EQ(text(folderPath(Folder::Debug, L"x")), QString(259, 'u'));
}

TEST_F(WorkstationFoldersTest, ScratchResultsLastForTheNextCalls)
{
    setSystemFolder(L"S");
    const wchar_t *const first = folderPath(Folder::EQPresets, L"1");
    for (std::size_t call = 1; call < kScratchResults; ++call)
        folderPath(Folder::FXPresets);
    EXPECT_EQ(text(first), QStringLiteral("S\\EQ Presets\\1"));
    EXPECT_EQ(folderPath(Folder::Shaders), first);
}

TEST_F(WorkstationFoldersTest, InstallRootAndProfiles)
{
    EXPECT_EQ(text(installRootPath(L"a.dll")), QString());
    setInstallRoot(L"C:\\Program\\");
    EXPECT_EQ(text(installRootPath()), QStringLiteral("C:\\Program\\"));
    EXPECT_EQ(text(installRootPath(L"a.dll")), QStringLiteral("C:\\Program\\a.dll"));
    const QByteArray before = qgetenv("TMP");
    qputenv("TMP", "T");
    EXPECT_EQ(text(profilesPath()), QStringLiteral("T\\tesselprofiles\\"));
    EXPECT_EQ(text(profilesPath(L"p")), QStringLiteral("T\\tesselprofiles\\p"));
    qunsetenv("TMP");
    EXPECT_EQ(text(profilesPath(L"p")), QStringLiteral("\\tesselprofiles\\p"));
    if (!before.isNull())
        qputenv("TMP", before);
}
