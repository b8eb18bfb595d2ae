#include "Core/BaseLib/Files/FileFinder.h"

#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/TestFolder.h"

#include <gtest/gtest.h>

namespace {

/// What a finder answers, seen from "Plugins" and joined by bars.
QString found(FileFinder &finder, const TestFolder &folder, const QString &ending,
              const FileFinder::Cancelled &isCancelled = nullptr)
{
    return finder.find({folder.plugins()}, ending, isCancelled).join('|').remove(folder.plugins() + '/');
}

} // namespace

TEST(FileFinder, ListsAFolderByNameAndThenWhatLiesBelow)
{
    const CapturedLog log;
    const TestFolder folder;
    const QString tree =
        "sub/deep/z.vst3|sub/a.vst3|b.vst3|A.VST3|C.vst3/Contents/C.so|C.vst3/Contents/inner.vst3|🎸.vst3|"
        "残響/残響.vst3|a %1 [x].vst3|.hidden.vst3|.hidden/x.vst3|x.vst3.bak|vst3|x.dll|none/x.txt";
    for (const QString &name : tree.split('|'))
        folder.write("Plugins/" + name, "");
    FileFinder finder({".vst3", ".dll", ".scan"});
    EXPECT_EQ(found(finder, folder, ".vst3"),
              "a %1 [x].vst3|A.VST3|b.vst3|C.vst3|🎸.vst3|C.vst3/Contents/inner.vst3|sub/a.vst3|"
              "sub/deep/z.vst3|残響/残響.vst3");
    folder.write("Plugins/later.dll", "");
    EXPECT_EQ(found(finder, folder, ".DLL"), "x.dll") << "one walk for all endings";
    EXPECT_EQ(found(finder, folder, ".scan"), "");
    EXPECT_EQ(log.lines(), QStringList()) << "a folder that merely holds nothing is not reported";
}

TEST(FileFinder, AFolderThatIsCalledLikeAnEndingIsNotAModule)
{
    const TestFolder folder;
    folder.write("Plugins/.vst3/a.vst3", {});
    EXPECT_EQ(FileFinder({".vst3"}).find({folder.path("Plugins/.vst3")}, ".vst3"),
              QStringList(folder.path("Plugins/.vst3/a.vst3")));
}

TEST(FileFinder, CancelIsAskedBeforeEachFolder)
{
    const TestFolder folder;
    for (const char *name : {"Plugins/a.vst3", "Plugins/b/b.vst3", "Plugins/c/c.vst3"})
        folder.write(name, "");
    FileFinder finder({".vst3"});
    int asked = 0;
    EXPECT_EQ(found(finder, folder, ".vst3", [&asked] { return ++asked > 2; }), "a.vst3|b/b.vst3");
    EXPECT_EQ(found(finder, folder, ".vst3"), "a.vst3|b/b.vst3|c/c.vst3")
        << "a cancelled search is no answer";
}
