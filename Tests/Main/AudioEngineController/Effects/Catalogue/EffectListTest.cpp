#include "Main/AudioEngineController/Effects/Catalogue/EffectList.h"

#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

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
        EffectRecord record;
        record.name = "kept";
        record.path = row.path;
        EXPECT_EQ(NameFromPath(record), row.name != nullptr) << row.path;
        EXPECT_EQ(record.name, row.name ? row.name : "kept") << row.path;
    }
}

TEST(EffectList, TakesNothingWithoutAnIdentifier)
{
    EffectList list;
    EffectRecord record;
    record.name = "Nameless";
    EXPECT_FALSE(list.add(record));
    EXPECT_EQ(list.size(), 0u);
}
