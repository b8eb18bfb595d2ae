#include "Core/BaseLib/Binary/PluginLibrary.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"

#include <gtest/gtest.h>

namespace {

using CountUnloading = void (*)(int *);

CountUnloading countUnloading(const PluginLibrary &library)
{
    return reinterpret_cast<CountUnloading>(library.symbol("countUnloading"));
}

} // namespace

TEST(PluginLibrary, UnloadsWhenItShould)
{
    const struct {
        const char *name;
        bool cached;
        void (*drop)(PluginLibrary &);
        bool stillLoaded;
        int unloaded;
    } rows[] = {
        {"freed, twice", false, [](PluginLibrary &l) { l.free(), l.free(); }, false, 1},
        {"freed by its destructor", false, [](PluginLibrary &) {}, true, 1},
        {"left mapped", false, [](PluginLibrary &l) { l.leaveMapped(); }, false, 0},
        {"freed in the process cache", true, [](PluginLibrary &l) { l.free(); }, true, 0},
    };
    for (const auto &row : rows) {
        const EmptyFolder folder;
        const QString path = folder.path("残響🎸.vst3"_q);
        ASSERT_TRUE(QFile::copy(ONE_FUNCTION_LIBRARY, path));
        int unloaded = 0;
        CountUnloading count = nullptr;
        {
            PluginLibrary library;
            library.useProcessCache = row.cached;
            EXPECT_EQ(countUnloading(library), nullptr) << "nothing is loaded yet";
            ASSERT_TRUE(library.load(path.toStdWString())) << library.errorText().toStdString();
            EXPECT_EQ(library.symbol("noSuchFunction"), nullptr);
            ASSERT_NE(count = countUnloading(library), nullptr);
            count(&unloaded);
            row.drop(library);
            EXPECT_EQ(library.isLoaded(), row.stillLoaded) << row.name;
            EXPECT_EQ(countUnloading(library), row.stillLoaded ? count : nullptr) << row.name;
        }
        EXPECT_EQ(unloaded, row.unloaded) << row.name;
        if (unloaded == 0)
            count(nullptr); // it must not keep the address
    }
}

TEST(PluginLibrary, ProcessCacheSharesHandlesAndForgetsFailures)
{
    const EmptyFolder folder;
    const QString path = folder.path("later.vst3"_q);
    EXPECT_FALSE(PluginLibrary::exists(path));
    PluginLibrary first;
    PluginLibrary second;
    first.useProcessCache = second.useProcessCache = true;
    EXPECT_FALSE(first.load(path));
    EXPECT_FALSE(first.errorText().isEmpty());
    ASSERT_TRUE(QFile::copy(ONE_FUNCTION_LIBRARY, path));
    EXPECT_TRUE(PluginLibrary::exists(path));
    EXPECT_TRUE(first.load(path));
    EXPECT_EQ(first.errorText(), QString());
    EXPECT_TRUE(second.load(path));
    EXPECT_EQ(countUnloading(first), countUnloading(second));
}
