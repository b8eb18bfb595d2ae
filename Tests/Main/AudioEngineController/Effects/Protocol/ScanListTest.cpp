#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"

#include "Tests/Support/QtPrinters.h"

#include <QTemporaryDir>

#include <gtest/gtest.h>

TEST(ScanList, DataFolderOfAPath)
{
    const std::pair<const char *, const char *> rows[] = {
        {"C:\\x\\Effects\\FXScan.xml", "C:\\x"},
        {"C:/a/Effects/b/Effects/FXScan.xml", "C:/a/Effects/b"},
        {"/home/me/effects/FXScan.xml", ""},
        {"C:\\x/Effects/FXScan.xml", "C:\\x"},
        {"C:/x/Effects/y\\Effects\\FXScan.xml", "C:/x"}, // the forward form is tried first
        {"/Effects/FXScan.xml", ""},
        {"Effects/FXScan.xml", ""},
        {"FXScan.xml", ""},
        {"/Effects/", ""},
        {"/データ/Effects/FXScan.xml", "/データ"},
    };
    for (const auto &[path, folder] : rows)
        EXPECT_EQ(dataFolderOf(path), folder) << path;
}

TEST(ScanList, WrittenAndReadBack)
{
    const QTemporaryDir folder;
    const QString path = folder.filePath("FXScan.xml");
    const QStringList folders = {"/usr/lib/vst3", "/プラグイン 🎹", QString()};
    ASSERT_TRUE(WriteScanList(path, folders));
    QByteArray text;
    ASSERT_TRUE(readWholeFile(path, text));
    EXPECT_EQ(text.replace(kLineEnd, "\n"), QByteArray("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                                                       "<Scan>\n"
                                                       "\t<Path>/usr/lib/vst3</Path>\n"
                                                       "\t<Path>/プラグイン 🎹</Path>\n"
                                                       "\t<Path></Path>\n"
                                                       "</Scan>\n"));
    EXPECT_EQ(ReadScanList(path), folders);
}
