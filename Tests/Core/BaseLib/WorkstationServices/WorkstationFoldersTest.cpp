#include "Core/BaseLib/WorkstationServices/WorkstationFolders.h"

#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

using namespace WorkstationFolders;

namespace {
QString text(const wchar_t *result) { return QString::fromWCharArray(result); }
} // namespace

TEST(WorkstationFolders, EveryGetter)
{
    // In the order of the folders; a star: scratch.
    const QStringList rows =
        QString("W/Debug|W/Undo|W/Media|W/Meters|W/Temp|W/DeviceInfo|*W/MXF_Indexed_Files|W/Template Ramps|"
                "W/VideoStream|W|P/Macros|P/Dissolves|*P/EQ Presets|*P/FX Presets|*P/Fade Presets|P/Machines|"
                "*P/EdlConfig|P/CapturePreset|P|C:/S/Effects|C:/S/Effects/VSTPlugins|C:/S/Pictures|"
                "C:/S/FileFormatPlugins|C:/S/Machines|*C:/S/Shaders|C:/S")
            .replace('/', '\\')
            .split('|');
    setSystemFolder(L"C:\\S\\\\/");
    EXPECT_EQ(text(auxFolder()) + text(folderPath(Folder::WorkRoot)), "C:\\SC:\\S");
    EXPECT_EQ(setWorkFolder(L"W") + setPresetFolder(L"P") + setAuxFolder(L"A"), 0);
    EXPECT_EQ(text(themesFolder()) + text(auxFolder()), "C:\\S\\ThemesA");
    for (const bool isOverridden : {false, true}) {
        setShadersOverride(isOverridden);
        for (int index = 0; index < rows.size(); ++index) {
            const auto folder = static_cast<Folder>(index);
            const bool isScratch = rows[index].startsWith('*');
            const QString path = rows[index].mid(isScratch ? 1 : 0);
            EXPECT_EQ(text(folderPath(folder)), path);
            EXPECT_EQ(text(folderPath(folder, L"FX.xml")), path + "\\FX.xml");
            EXPECT_EQ(folderPath(folder) != folderPath(folder), isScratch) << qPrintable(path);
        }
    }
    EXPECT_EQ(text(installRootPath(L"a.dll")), "");
    setInstallRoot(L"I\\");
    EXPECT_EQ(text(installRootPath(L"a.dll")), "I\\a.dll");
    const QByteArray before = qgetenv("TMP");
    qputenv("TMP", "T");
    EXPECT_EQ(text(profilesPath(L"p")), "T\\tesselprofiles\\p");
    qputenv("TMP", before);
    for (const int length : {0, 258, 259, 300}) {
        const QString longName(length, 'x');
        setSystemFolder(longName.toStdWString().c_str());
        EXPECT_EQ(text(folderPath(Folder::Effects, L"a")), (longName + "\\Effects\\a").left(259)) << length;
    }
    setSystemFolder(nullptr);
}
