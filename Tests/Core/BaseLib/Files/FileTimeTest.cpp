#include "Core/BaseLib/Files/FileTime.h"
#include "Core/BaseLib/Files/NativeFile.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"

#include <QDateTime>

#include <gtest/gtest.h>

namespace {

void setModified(const QString &path, const QDateTime &time)
{
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::ReadWrite) && file.setFileTime(time, QFileDevice::FileModificationTime));
}

QDateTime localTime(const char *text)
{
    return QDateTime::fromString(QString::fromLatin1(text), Qt::ISODateWithMs);
}

} // namespace

TEST(FileTime, IsLocalTimeInMinutes)
{
    const EmptyFolder folder;
    const QString path = folder.write("残響.vst3"_q);
    const QString epoch = QDateTime::fromMSecsSinceEpoch(0).toString("yyyy-MM-dd hh:mm"_q);
    const struct {
        const char *name;
        QDateTime time;
        QString text;
    } rows[] = {
        {"leading zeros", localTime("2024-03-09T07:05:59"), "2024-03-09 07:05"_q},
        {"24 hours", localTime("1999-12-31T23:59:00"), "1999-12-31 23:59"_q},
        {"start of 1970", QDateTime::fromMSecsSinceEpoch(0), epoch},
        {"in 1970", localTime("1970-06-01T12:00:00"), "1970-06-01 12:00"_q},
        {"in the future", localTime("2199-01-01T12:00:00"), "2199-01-01 12:00"_q},
    };
    for (const auto &row : rows) {
        setModified(path, row.time);
        EXPECT_EQ(fileTimeText(path), row.text) << row.name;
        EXPECT_EQ(fileStamp(path).modifiedNanoseconds, row.time.toMSecsSinceEpoch() * 1000000) << row.name;
    }
    EXPECT_EQ(regularFileTimeText(path), fileTimeText(path));
    EXPECT_EQ(fileTimeText(folder.path("none"_q)), QString());
    EXPECT_NE(fileTimeText(folder.path()), QString());
    EXPECT_EQ(regularFileTimeText(folder.path()), QString());
}

TEST(FileStamp, SeesWhatTheTextCannot)
{
    const EmptyFolder folder;
    const QString path = folder.write("a.xml"_q, "1");
    const QDateTime time = localTime("2024-03-09T07:05:10.100");
    setModified(path, time);
    const FileStamp first = fileStamp(path);
    EXPECT_EQ(first, fileStamp(path));
    EXPECT_EQ(first.size, 1);
    setModified(path, time.addMSecs(1));
    EXPECT_NE(first, fileStamp(path)) << "a millisecond later";
    EXPECT_EQ(fileTimeText(path), "2024-03-09 07:05"_q);
    folder.write("a.xml"_q, "12");
    setModified(path, time);
    EXPECT_NE(first, fileStamp(path)) << "same time, other size";
    EXPECT_EQ(fileStamp(folder.path("none"_q)), FileStamp());
}

TEST(FileStamp, BeyondItsRangeStaysInOrderAndTouchingMeansNow)
{
    const EmptyFolder folder;
    const QString path = folder.write("残響.scan3"_q);
    constexpr qint64 kYear2200 = 7258118400000000000;
    setModified(path, localTime("2300-01-01T12:00:00"));
    if (!fileTimeText(path).startsWith("2300"_q))
        GTEST_SKIP() << "this file system keeps no such date";
    EXPECT_GT(fileStamp(path).modifiedNanoseconds, kYear2200);
    touchFile(path);
    EXPECT_LT(fileStamp(path).modifiedNanoseconds, kYear2200);
}
