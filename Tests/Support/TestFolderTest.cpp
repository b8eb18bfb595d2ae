#include "Tests/Support/TestFolder.h"

#include "Core/BaseLib/FileTime.h"
#include "Tests/Support/VST3Fixture.h"

#include <QFileInfo>

#include <gtest/gtest.h>

TEST(TestFolder, IsADataFolderThatLeavesNothingBehind)
{
    QString path;
    {
        const TestFolder folder;
        path = folder.dataFolder();
        folder.writeScanList({QStringLiteral("/a & b"), folder.plugins()});
        EXPECT_EQ(folder.lines(QStringLiteral("Effects/FXScan.xml")),
                  QStringList({QStringLiteral("<?xml version=\"1.0\" encoding=\"UTF-8\"?>"),
                               QStringLiteral("<Scan>"), QStringLiteral("\t<Path>/a & b</Path>"),
                               QStringLiteral("\t<Path>") + folder.plugins() + QStringLiteral("</Path>"),
                               QStringLiteral("</Scan>")}));
        for (const char *name : {"b.scan", "Comp .scan3", "VST3Configuration.xml", "sub/c.scan3"})
            folder.write(QStringLiteral("Effects/") + QLatin1String(name), "text");
        EXPECT_EQ(folder.markers(), QStringList({QStringLiteral("Comp .scan3"), QStringLiteral("b.scan")}));
        EXPECT_EQ(folder.catalogue(), "text");
        EXPECT_EQ(folder.catalogue(QStringLiteral("FXConfiguration.xml")), QByteArray());
    }
    EXPECT_FALSE(QFileInfo::exists(path));
}

TEST(TestFolder, FilesTakeTheTimeTheyAreGiven)
{
    const TestFolder folder;
    const QString bundle = addVST3Bundle(folder.plugins(), QStringLiteral("Comp x64"));
    folder.setModified(vst3BundleBinary(bundle), QDateTime({2020, 2, 29}, {23, 59, 58}));
    EXPECT_EQ(fileTimeText(vst3BundleBinary(bundle)), QStringLiteral("2020-02-29 23:59"));
    EXPECT_NE(fileTimeText(bundle), QStringLiteral("2020-02-29 23:59"));
}
