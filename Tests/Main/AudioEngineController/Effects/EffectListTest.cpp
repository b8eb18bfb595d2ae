#include "Main/AudioEngineController/Effects/EffectList.h"

#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

namespace {

EffectRecord effect(const char *id, const char *name, const char *path)
{
    EffectRecord record;
    record.id = QString::fromUtf8(id);
    record.name = QString::fromUtf8(name);
    record.path = QString::fromUtf8(path);
    return record;
}

} // namespace

TEST(NameFromPath, TakesOutTheBitnessMarks)
{
    const struct {
        const char *path;
        bool isNamed;
        const char *name;
    } rows[] = {
        {"/fx/Comp.vst3", true, "Comp"},
        {"/fx/Comp x64.vst3", true, "Comp "},
        {"/fx/Comp_64.dll", true, "Comp"},
        {"/fx/Comp 64bit.dll", true, "Comp"},
        {"/fx/x64_64 64bit x64.dll", true, " x64"}, // each mark once, the first of its kind
        {"/fx/My Synth.x64.dll", true, "My Synth."},
        {"Comp.vst3", true, "Comp"},
        {"/fx/Comp", false, "kept"},
        {"", false, "kept"},
        {"/fx.d/Comp", true, "Comp"},
        {"/fx/.vst3", true, ""},
        {"/fx/真空管 x64.vst3", true, "真空管 "},
    };
    for (const auto &row : rows) {
        EffectRecord record = effect("id", "kept", row.path);
        EXPECT_EQ(NameFromPath(record), row.isNamed) << row.path;
        EXPECT_EQ(record.name, QString::fromUtf8(row.name)) << row.path;
    }
}

TEST(EffectList, IdentifiersAreUniqueAndNamesToo)
{
    EffectList list;
    EXPECT_FALSE(list.add(effect("", "Nameless", "/a.vst3"))) << "no identifier";
    EXPECT_TRUE(list.add(effect("1", "Comp", "/a.vst3")));
    EXPECT_FALSE(list.add(effect("1", "Other", "/b.vst3"))) << "the identifier is held";
    EXPECT_TRUE(list.add(effect("2", "Comp", "/Comp x64.vst3")));
    EXPECT_EQ(list.find(QStringLiteral("2"))->name, QStringLiteral("Comp "));
    // A name made from a path does not count as used.
    EXPECT_TRUE(list.add(effect("3", "Comp ", "/c.vst3")));
    EXPECT_EQ(list.find(QStringLiteral("3"))->name, QStringLiteral("Comp "));
    EXPECT_EQ(list.size(), 3u);
}

TEST(EffectList, ARemovedRecordFreesItsName)
{
    EffectList list;
    list.add(effect("1", "Comp", "/a.vst3"));
    list.remove(QStringLiteral("1"));
    list.remove(QStringLiteral("unknown"));
    EXPECT_TRUE(list.add(effect("2", "Comp", "/b.vst3")));
    EXPECT_EQ(list.find(QStringLiteral("2"))->name, QStringLiteral("Comp"));
}
