#include "Core/BaseLib/Files/FileFinder.h"
#include "Core/BaseLib/Files/NativeFile.h"
#include "Core/BaseLib/Files/TextFile.h"

#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/TestFolder.h"

#include <QDir>
#include <QFile>

#include <csignal>
#include <functional>

#include <grp.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>

namespace {

/// The paths found in "Plugins", seen from there and joined by bars.
QString modulesIn(const TestFolder &folder)
{
    return findFiles(folder.plugins(), ".vst3").join('|').remove(folder.plugins() + '/');
}

void setMode(const QString &path, mode_t mode) { chmod(QFile::encodeName(path).constData(), mode); }

bool becomeOrdinaryUser()
{
    constexpr uid_t kNobody = 65534;
    return getuid() != 0 || (setgroups(0, nullptr) == 0 && setresgid(kNobody, kNobody, kNobody) == 0 &&
                             setresuid(kNobody, kNobody, kNobody) == 0);
}

/// Runs the body in a child process that permissions apply to: root's child gives up its rights. True when
/// the body answered true.
bool trueForOrdinaryUser(const std::function<bool()> &body)
{
    const pid_t child = fork();
    if (child == 0)
        _exit(becomeOrdinaryUser() && body() ? 0 : 1);
    int status = -1;
    return child > 0 && waitpid(child, &status, 0) == child && WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

} // namespace

TEST(FileSystem, LinksAreListedOnceAndWhatCannotBeAModuleIsNot)
{
    const TestFolder folder;
    folder.write("Elsewhere/x.vst3", ""); // which "A.vst3" holds and "b.vst3" is
    const QString plugins = folder.plugins() + '/';
    const std::pair<QString, QString> links[] = {{"folder", folder.path("Elsewhere")},
                                                 {"A.vst3", folder.path("Elsewhere")},
                                                 {"b.vst3", folder.path("Elsewhere/x.vst3")},
                                                 {"c.vst3", "."},
                                                 {"self.vst3", "self.vst3"},
                                                 {"z.vst3", "gone"}};
    for (const auto &[name, target] : links)
        ASSERT_TRUE(QFile::link(target, plugins + name));
    const QByteArray notText = plugins.toUtf8() + "bad\xFF.vst3";
    ASSERT_EQ(mknod(notText.constData(), S_IFREG | 0644, 0), 0);
    ASSERT_EQ(mkfifo(qPrintable(plugins + "pipe.vst3"), 0644), 0); // to open it would hang
    EXPECT_EQ(modulesIn(folder), "A.vst3|A.vst3/x.vst3");
    EXPECT_EQ(remove(notText.constData()), 0); // Qt cannot name it, so it could not remove it either
    QByteArray content;
    EXPECT_FALSE(readWholeFile(plugins + "pipe.vst3", content));
}

TEST(FileSystem, AnUnreadableFolderIsReportedAndItsNeighboursAreFound)
{
    const TestFolder folder;
    for (const char *name : {"a/a.vst3", "closed/x.vst3", "z/z.vst3"})
        folder.write(QString("Plugins/") + name, "");
    setMode(folder.dataFolder(), 0755);
    setMode(folder.path("Plugins/closed"), 0);
    EXPECT_TRUE(trueForOrdinaryUser([&folder] {
        const CapturedLog log;
        return modulesIn(folder) == "a/a.vst3|z/z.vst3" && log.count("closed\": Permission denied") == 1;
    }));
    EXPECT_TRUE(trueForOrdinaryUser([&folder] {
        return cannotBeExamined(folder.path("Plugins/closed/x.vst3")) &&
               !cannotBeExamined(folder.path("Plugins/a/none"));
    }));
    setMode(folder.path("Plugins/closed"), 0755);
}

TEST(ReplaceFile, LinksPermissionsAndReadersStay)
{
    const TestFolder folder;
    folder.write("There/a.xml", "old");
    QFile reader(folder.path("There/a.xml"));
    const QString link = folder.path("link.xml");
    setMode(reader.fileName(), 0757);
    ASSERT_TRUE(QFile::link(reader.fileName(), link) && reader.open(QIODevice::ReadOnly));
    EXPECT_TRUE(replaceFile(link, "new", Durability::Synced));
    EXPECT_EQ(QFile::symLinkTarget(link), reader.fileName());
    EXPECT_EQ(folder.read("There/a.xml"), "new");
    struct stat status = {};
    stat(qPrintable(link), &status);
    EXPECT_EQ(status.st_mode & 07777U, 0757U);
    EXPECT_EQ(reader.readAll(), "old") << "who has it open sees the old content whole";
    EXPECT_EQ(QDir(folder.path("There")).entryList(QDir::Files), QStringList("a.xml"));
}

TEST(ReplaceFile, ObeysPermissions)
{
    const TestFolder folder;
    for (const bool mayWrite :
         {true, false}) { // the file, in a folder that takes no temporary one, or the folder
        folder.write("a.xml", "long old content");
        setMode(folder.path("a.xml"), mayWrite ? 0666 : 0444);
        setMode(folder.dataFolder(), mayWrite ? 0555 : 0777);
        EXPECT_TRUE(trueForOrdinaryUser([&] {
            return bool(replaceFile(folder.path("a.xml"), "new", Durability::Buffered)) == mayWrite;
        })) << mayWrite;
        setMode(folder.dataFolder(), 0755);
        EXPECT_EQ(folder.read("a.xml"), mayWrite ? "new" : "long old content");
    }
}

TEST(ReplaceFile, WhatDoesNotFitLeavesWhatWasThere)
{
    const TestFolder folder;
    folder.write("a.xml", "old content");
    setMode(folder.path("a.xml"), 0666);
    setMode(folder.dataFolder(), 0555);
    EXPECT_TRUE(trueForOrdinaryUser([&folder] {
        const rlimit limit = {16, 16};
        return signal(SIGXFSZ, SIG_IGN) != SIG_ERR && setrlimit(RLIMIT_FSIZE, &limit) == 0 &&
               replaceFile(folder.path("a.xml"), "new content that is longer", Durability::Buffered).reason ==
                   "File too large";
    }));
    setMode(folder.dataFolder(), 0755);
    EXPECT_EQ(folder.read("a.xml"), "old content");
}
