#include "Core/BaseLib/Binary/PluginLibrary.h"

#include "Tests/Support/TestFolder.h"

#include <QFile>

#include <gtest/gtest.h>

TEST(PluginLibrary, TheProcessCacheKeepsHandlesAndForgetsFailures)
{
    const TestFolder folder;
    for (const bool isCached : {false, true}) {
        const QString path = folder.path(isCached ? "残響🎸.vst3" : "later.vst3");
        PluginLibrary library;
        library.useProcessCache = isCached;
        EXPECT_FALSE(library.load(path.toStdWString()));
        EXPECT_FALSE(library.errorText().isEmpty());
        ASSERT_TRUE(QFile::copy(ONE_FUNCTION_LIBRARY, path));
        ASSERT_TRUE(library.load(path.toStdWString())) << library.errorText().toStdString();
        EXPECT_EQ(library.errorText(), QString());
        EXPECT_NE(library.symbol("answer"), nullptr);
        EXPECT_EQ(library.symbol("noSuchFunction"), nullptr);
        PluginLibrary second;
        second.useProcessCache = isCached;
        EXPECT_TRUE(second.load(path));
        EXPECT_EQ(second.handle(), library.handle());
        library.free();
        EXPECT_EQ(library.isLoaded(), isCached);
        EXPECT_EQ(library.symbol("answer") != nullptr, isCached);
    }
}
