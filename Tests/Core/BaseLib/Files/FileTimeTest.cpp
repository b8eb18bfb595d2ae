#include "Core/BaseLib/Files/FileTime.h"

#include "Tests/Support/TestFolder.h"

#include <QFile>

#include <gtest/gtest.h>

namespace {
QDateTime localTime(const char *text) { return QDateTime::fromString(text, Qt::ISODateWithMs); }
} // namespace

TEST(FileTime, IsLocalTimeInMinutesAndTheStampIsFiner)
{
    const TestFolder folder;
    folder.write("残響.vst3", "1");
    const QString path = folder.path("残響.vst3");
    const QDateTime epoch = QDateTime::fromMSecsSinceEpoch(0);
    const std::pair<QDateTime, QString> rows[] = {
        {localTime("2024-03-09T07:05:59"), "2024-03-09 07:05"},
        {localTime("1999-12-31T23:59:00.001"), "1999-12-31 23:59"},
        {epoch, epoch.toString("yyyy-MM-dd hh:mm")},
        {localTime("2199-01-01T12:00:00"), "2199-01-01 12:00"},
    };
    for (const auto &[time, text] : rows) {
        folder.setModified(path, time);
        EXPECT_EQ(fileTimeText(path), text);
        EXPECT_EQ(fileStamp(path), (FileStamp{time.toMSecsSinceEpoch() * 1000000, 1})) << text.toStdString();
    }
    EXPECT_EQ(fileStamp(folder.path("none")), FileStamp());
    EXPECT_EQ(fileTimeText(folder.path("none")), QString());
    EXPECT_NE(fileTimeText(folder.plugins()), QString());
    EXPECT_EQ(regularFileTimeText(folder.plugins()), QString());
}

TEST(TouchFile, ChangesTheTimeOfAnExistingFileAndNothingElse)
{
    const TestFolder folder;
    folder.write("残響.scan3", "marker");
    const QString path = folder.path("残響.scan3");
    folder.setModified(path, localTime("2300-01-01T12:00:00"));
    const QDateTime before = QDateTime::currentDateTime().addSecs(-10);
    touchFile(path);
    EXPECT_GE(fileTimeText(path), before.toString("yyyy-MM-dd hh:mm"));
    EXPECT_LT(fileTimeText(path), "2300");
    EXPECT_EQ(folder.read("残響.scan3"), "marker");
    touchFile(folder.path("none"));
    EXPECT_FALSE(QFile::exists(folder.path("none")));
}
