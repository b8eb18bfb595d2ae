#include "Main/AudioEngineController/Effects/Catalogue/EffectList.h"

#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

namespace {

EffectRecord effect(const char *id, const char *name, const char *path)
{
    EffectRecord record;
    record.id = id;
    record.name = name;
    record.path = path;
    return record;
}

} // namespace

TEST(NameFromPath, TakesOutTheBitnessMarks)
{
    const struct {
        const char *path, *name; ///< null: it gives none
    } rows[] = {{"/fx/Comp.vst3", "Comp"},
                {"/fx/Comp_64.dll", "Comp"},
                {"/fx/Comp 64bit.dll", "Comp"},
                {"/fx/x64_64 64bit x64.dll", " x64"}, // each mark once, the first of its kind
                {"/fx/My Synth.x64.dll", "My Synth."},
                {"Comp.vst3", "Comp"},
                {"/fx/Comp", nullptr},
                {"", nullptr},
                {"/fx.d/Comp", "Comp"},
                {"/fx/.vst3", ""},
                {"/fx/真空管 x64.vst3", "真空管 "}};
    for (const auto &row : rows) {
        EffectRecord record = effect("id", "kept", row.path);
        EXPECT_EQ(NameFromPath(record), row.name != nullptr) << row.path;
        EXPECT_EQ(record.name, row.name ? row.name : "kept") << row.path;
    }
}

TEST(EffectList, IdentifiersAreUniqueAndNamesToo)
{
    EffectList list;
    EXPECT_FALSE(list.add(effect("", "Nameless", "/a.vst3"))) << "no identifier";
    EXPECT_TRUE(list.add(effect("1", "Comp", "/a.vst3")));
    EXPECT_FALSE(list.add(effect("1", "Other", "/b.vst3"))) << "the identifier is held";
    EXPECT_TRUE(list.add(effect("2", "Comp", "/Comp x64.vst3")));
    EXPECT_EQ(list.find("2")->name, "Comp ");
    // A name made from a path does not count as used.
    EXPECT_TRUE(list.add(effect("3", "Comp ", "/c.vst3")));
    EXPECT_EQ(list.find("3")->name, "Comp ");
    EXPECT_EQ(list.size(), 3u);
    list.remove("1");
    list.remove("unknown");
    EXPECT_TRUE(list.add(effect("4", "Comp", "/d.vst3")));
    EXPECT_EQ(list.find("4")->name, "Comp") << "free again";
}
