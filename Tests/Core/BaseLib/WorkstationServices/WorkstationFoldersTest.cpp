#include "Core/BaseLib/WorkstationServices/WorkstationFolders.h"

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
    // In the order of the folders; a star: scratch.
    const QStringList rows =
        QString::fromUtf8(
            "W\\Debug|W\\Undo|W\\Media|W\\Meters|W\\Temp|W\\DeviceInfo|*W\\MXF_Indexed_Files|"
            "W\\Template Ramps|W\\VideoStream|W|P/\\Macros|P/\\Dissolves|*P/\\EQ Presets|"
            "*P/\\FX Presets|*P/\\Fade Presets|P/\\Machines|*P/\\EdlConfig|P/\\CapturePreset|P/|"
            "C:\\Data\\Effects|C:\\Data\\Effects\\VSTPlugins|C:\\Data\\Pictures|"
            "C:\\Data\\FileFormatPlugins|C:\\Data\\Machines|*C:\\Data\\Shaders|C:\\Data")
            .split('|');
    setSystemFolder(L"C:\\Data\\\\/");
    EXPECT_EQ(text(auxFolder()), QStringLiteral("C:\\Data"));
    EXPECT_EQ(setWorkFolder(L"W") + setPresetFolder(L"P/") + setAuxFolder(L"A"), 0);
    EXPECT_EQ(text(themesFolder()), QStringLiteral("C:\\Data\\Themes"));
    EXPECT_EQ(text(auxFolder()), QStringLiteral("A"));
    std::set<const wchar_t *> buffers;
    for (const bool isOverridden : {false, true}) {
        setShadersOverride(isOverridden);
        for (int index = 0; index < rows.size(); ++index) {
            const auto folder = static_cast<Folder>(index);
            const bool isScratch = rows[index].startsWith('*');
            const QString path = rows[index].mid(isScratch ? 1 : 0);
            EXPECT_EQ(text(folderPath(folder, L"FX.xml")), path + "\\FX.xml");
            const wchar_t *const result = folderPath(folder);
            EXPECT_EQ(text(result), path);
            EXPECT_EQ(result != folderPath(folder), isScratch) << qPrintable(path);
            EXPECT_EQ(text(folderPath(folder, folderPath(folder))), path + '\\' + path);
            buffers.insert(isScratch ? nullptr : result);
        }
    }
    EXPECT_EQ(buffers.size(), 21u) << "each its own, and the pool";
}

TEST_F(WorkstationFoldersTest, RootsAreStrippedAndCut)
{
    const std::wstring most(258, L'x');
    const std::wstring longest = most + L'x';
    const struct {
        const char *name;
        std::wstring system;
        std::wstring root;
    } rows[] = {{"unset", L"", L""},
                {"separators only", L"\\/\\", L""},
                {"as long as can be", longest, longest},
                {"longer", longest + L"yz", longest},
                {"separators where it is cut", most + L"\\\\y", most},
                {"half a character where it is cut", most + wchar_t(0xD83D) + wchar_t(0xDE00), most}};
    for (const auto &row : rows) {
        setSystemFolder(row.system.c_str());
        const QString root = QString::fromStdWString(row.root);
        EXPECT_EQ(text(folderPath(Folder::SystemRoot)), root) << row.name;
        EXPECT_EQ(text(folderPath(Folder::Debug)), (root + "\\Debug").left(259)) << row.name;
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
