#include "Core/BaseLib/FileFinder.h"

#include "Tests/Core/BaseLib/Fixtures.h"
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

FileFinder moduleFinder() { return FileFinder(".vst3"_q); }

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
    EXPECT_EQ(moduleFinder().find(folder.path()), expected);
    EXPECT_EQ(moduleFinder().find(folder.path("sub/..//"_q)), expected);
    EXPECT_EQ(FileFinder(".DLL"_q).find(folder.path()), pathsIn(folder, {"x.dll"_q}));
    EXPECT_EQ(FileFinder(".scan"_q).find(folder.path()), QStringList());
    EXPECT_EQ(log.lines(), QStringList()) << "folders that merely hold nothing are no fault";
}

TEST(FileFinder, CancelIsAskedBeforeEachFolder)
{
    const EmptyFolder folder;
    folder.write("a.vst3"_q);
    folder.write("b/b.vst3"_q);
    folder.write("c/c.vst3"_q);
    FileFinder finder = moduleFinder();
    int asked = 0;
    finder.setCancelled([&asked] { return ++asked > 2; });
    EXPECT_EQ(finder.find(folder.path()), pathsIn(folder, {"a.vst3"_q, "b/b.vst3"_q}));
}

TEST(FileFinder, SharesWhatItSawOnlyWithThoseWhoAsk)
{
    const EmptyFolder folder;
    folder.write("a/a.vst3"_q);
    folder.write("a/a.so"_q);
    const auto listings = std::make_shared<FolderListings>();
    FileFinder first = moduleFinder();
    FileFinder second(".so"_q);
    first.setListings(listings);
    second.setListings(listings);
    EXPECT_EQ(first.find(folder.path()), pathsIn(folder, {"a/a.vst3"_q}));
    folder.write("a/later.so"_q);
    EXPECT_EQ(second.find(folder.path()), pathsIn(folder, {"a/a.so"_q}));
    EXPECT_EQ(FileFinder(".so"_q).find(folder.path()), pathsIn(folder, {"a/a.so"_q, "a/later.so"_q}));
}
