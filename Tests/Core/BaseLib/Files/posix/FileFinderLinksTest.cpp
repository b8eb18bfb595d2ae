#include "Core/BaseLib/Files/FileFinder.h"
#include "Core/BaseLib/Files/NativeFile.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"
#include "Tests/Core/BaseLib/Files/posix/OrdinaryUser.h"
#include "Tests/Support/CapturedLog.h"

#include <cstdio>

#include <sys/stat.h>

#include <gtest/gtest.h>

namespace {

QStringList modulesIn(const EmptyFolder &folder)
{
    QStringList names = findFiles(folder.path(), ".vst3"_q);
    for (QString &name : names)
        name.remove(folder.path() + QLatin1Char('/'));
    return names;
}

} // namespace

TEST(FileFinderLinks, AreListedAndNeverEntered)
{
    const EmptyFolder elsewhere;
    elsewhere.write("in/x.vst3"_q);
    const QString inside = elsewhere.path("in"_q);
    const struct {
        const char *name;
        QString link;
        QString target;
        QStringList found;
    } rows[] = {
        {"linked folder", "more"_q, inside, {}},
        {"linked folder named like a module", "X.vst3"_q, inside, {"X.vst3"_q}},
        {"linked file", "y.vst3"_q, inside + "/x.vst3"_q, {"y.vst3"_q}},
        {"link to its own folder", "loop.vst3"_q, "."_q, {"loop.vst3"_q}},
        {"link to the folder above", "up"_q, ".."_q, {}},
        {"link to itself", "self.vst3"_q, "self.vst3"_q, {}},
        {"link to nothing", "z.vst3"_q, "gone"_q, {}},
    };
    for (const auto &row : rows) {
        const CapturedLog log;
        const EmptyFolder folder;
        ASSERT_TRUE(QFile::link(row.target, folder.path(row.link))) << row.name;
        EXPECT_EQ(modulesIn(folder), row.found) << row.name;
        EXPECT_EQ(log.lines(), QStringList()) << row.name;
    }
}

TEST(FileFinder, PassesOverWhatCanBeNoModule)
{
    const EmptyFolder folder;
    const QByteArray noText = folder.nativePath("bad\xFF.vst3");
    const QByteArray noTextFolder = folder.nativePath("cut\xE6\xAE.vst3");
    folder.write("good.vst3"_q);
    ASSERT_EQ(mknod(noText.constData(), S_IFREG | 0644, 0), 0);
    ASSERT_EQ(mkdir(noTextFolder.constData(), 0755), 0);
    ASSERT_EQ(mkfifo(folder.nativePath("pipe.vst3").constData(), 0644), 0); // to open it would hang
    EXPECT_EQ(modulesIn(folder), QStringList("good.vst3"_q));
    // Qt cannot name them, so it could not remove them either.
    EXPECT_EQ(remove(noText.constData()), 0);
    EXPECT_EQ(remove(noTextFolder.constData()), 0);
}

TEST(FileFinder, AnUnreadableFolderIsOneLogLineAndItsNeighboursAreFound)
{
    const EmptyFolder folder;
    folder.write("a/a.vst3"_q);
    const QByteArray closed = folder.nativePath("closed");
    folder.write("closed/x.vst3"_q);
    folder.write("z/z.vst3"_q);
    ASSERT_EQ(chmod(folder.nativePath("").constData(), 0755), 0);
    ASSERT_EQ(chmod(closed.constData(), 0), 0);
    EXPECT_TRUE(trueForOrdinaryUser([&folder] {
        const CapturedLog log;
        return modulesIn(folder) == QStringList({"a/a.vst3"_q, "z/z.vst3"_q}) && log.lines().size() == 1 &&
               log.contains("closed\": Permission denied"_q);
    }));
    EXPECT_TRUE(trueForOrdinaryUser([&folder] {
        return cannotBeExamined(folder.path("closed/x.vst3"_q)) &&
               !cannotBeExamined(folder.path("a/a.vst3"_q)) && !cannotBeExamined(folder.path("a/none"_q));
    }));
    chmod(closed.constData(), 0755);
}
