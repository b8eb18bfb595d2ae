#include "Core/BaseLib/Files/FileFinder.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"
#include "Tests/Support/CapturedLog.h"

#include <gtest/gtest.h>

namespace {

QStringList pathsIn(const EmptyFolder &folder, const QStringList &names)
{
    QStringList paths;
    for (const QString &name : names)
        paths.append(folder.path(name));
    return paths;
}

} // namespace

TEST(FileFinder, ListsAFolderByNameAndThenWhatLiesBelow)
{
    const CapturedLog log;
    const EmptyFolder folder;
    const QString tree =
        "sub/deep/z.vst3|sub/a.vst3|b.vst3|A.VST3|C.vst3/Contents/C.so|C.vst3/Contents/inner.vst3|🎸.vst3|"
        "残響/残響.vst3|a %1 [x].vst3|.hidden.vst3|.hidden/x.vst3|x.vst3.bak|vst3|x.dll|none/x.txt"_q;
    for (const QString &name : tree.split(QLatin1Char('|')))
        folder.write(name);
    const QStringList expected = pathsIn(folder, {"a %1 [x].vst3"_q, "A.VST3"_q, "b.vst3"_q, "C.vst3"_q,
                                                  "🎸.vst3"_q, "C.vst3/Contents/inner.vst3"_q, "sub/a.vst3"_q,
                                                  "sub/deep/z.vst3"_q, "残響/残響.vst3"_q});
    EXPECT_EQ(findFiles(folder.path(), ".vst3"_q), expected);
    EXPECT_EQ(findFiles(folder.path("sub/..//"_q), ".vst3"_q), expected);
    EXPECT_EQ(findFiles(folder.path(), ".DLL"_q), pathsIn(folder, {"x.dll"_q}));
    EXPECT_EQ(findFiles(folder.path(), ".scan"_q), QStringList());
    EXPECT_EQ(log.lines(), QStringList()) << "folders that merely hold nothing are no fault";
}

TEST(FileFinder, CancelIsAskedBeforeEachFolder)
{
    const EmptyFolder folder;
    folder.write("a.vst3"_q);
    folder.write("b/b.vst3"_q);
    folder.write("c/c.vst3"_q);
    FileFinder finder({".vst3"_q});
    int asked = 0;
    EXPECT_EQ(finder.find(folder.path(), ".vst3"_q, [&asked] { return ++asked > 2; }),
              pathsIn(folder, {"a.vst3"_q, "b/b.vst3"_q}));
    EXPECT_EQ(finder.find(folder.path(), ".vst3"_q),
              pathsIn(folder, {"a.vst3"_q, "b/b.vst3"_q, "c/c.vst3"_q}))
        << "a search that was cancelled is no answer";
}

TEST(FileFinder, WalksOnceForAllEndings)
{
    const EmptyFolder folder;
    folder.write("a/a.vst3"_q);
    folder.write("a/a.so"_q);
    FileFinder finder({".vst3"_q, ".so"_q});
    EXPECT_EQ(finder.find(folder.path(), ".vst3"_q), pathsIn(folder, {"a/a.vst3"_q}));
    folder.write("a/later.so"_q);
    EXPECT_EQ(finder.find(folder.path(), ".so"_q), pathsIn(folder, {"a/a.so"_q}));
    EXPECT_EQ(findFiles(folder.path(), ".so"_q), pathsIn(folder, {"a/a.so"_q, "a/later.so"_q}));
}
