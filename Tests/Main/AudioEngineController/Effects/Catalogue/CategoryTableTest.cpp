#include "Main/AudioEngineController/Effects/Catalogue/CategoryTable.h"

#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Main/AudioEngineController/Effects/VST3/VST3SubCategories.h"
#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

TEST(CategoryTable, InternalBitsOfEveryCategory)
{
    // By index, from 1: the position in the sorted display names.
    const int positions[] = {4,  6,  9,  10, 12, 23, 13, 14, 15, 18, 16, 21, 20, 22,
                             24, 25, 19, 5,  26, 3,  11, 8,  7,  2,  17, 1,  0};
    const CategoryTable &table = CategoryTable::instance();
    for (int index = 1; index <= CategoryTable::kCount; ++index) {
        const quint32 internal = 1u << positions[index - 1];
        EXPECT_EQ(table.maskToCategory(1u << index), internal) << "index " << index;
        EXPECT_EQ(table.categoryToMask(internal), 1u << index) << "index " << index;
    }
    EXPECT_EQ(table.maskToCategory(0x4000080u), 0x2002u);
    EXPECT_EQ(table.categoryToMask(0x2002u), 0x4000080u);
    EXPECT_EQ(table.maskToCategory(0xF0000001u), 0u);
    EXPECT_EQ(table.sortedNames().first(), "-");
    EXPECT_EQ(table.sortedNames().at(table.instrumentPosition()), "Instrument");
    EXPECT_EQ(table.sortedNames().at(table.ambisonicsPosition()), "Ambisonics");
}

TEST(PluginIdentifier, PrefixesAndNames)
{
    const struct {
        const char *identifier;
        int format;
        const char *name;
    } rows[] = {{"mrl:comp", 1, "Built-in"}, {"vst2:Comp:1234", 2, "VST 2"}, {"au:x", 3, "Apple AudioUnit"},
                {"vst3:0123", 4, "VST 3"},   {"VST3:0123", 0, "Unknown"},    {"no prefix", 0, "Unknown"}};
    for (const auto &row : rows) {
        const QString prefix = prefixOf(row.identifier);
        EXPECT_EQ(static_cast<int>(formatOfPrefix(prefix)), row.format) << row.identifier;
        EXPECT_EQ(formatName(prefix), row.name) << row.identifier;
    }
    EXPECT_EQ(formatOfPrefix("vst3:more"), PluginFormat::Unknown) << "compared whole";
}

TEST(VST3SubCategories, WholeWordsBetweenBars)
{
    const struct {
        const char *text;
        quint32 mask; // file form
    } rows[] = {{"Fx", 0},
                {"Fx|Filter|Reverb", 0x4010},
                {"Instrument|Drum", 0x400080},
                {"Fx|Pitch Shift", 0x2000},
                {"Fx|Channel Strip|Up-Downmix", 0x8002},
                {"fx|eq", 0},
                {"EQualizer|SubDelay|Reverberation", 0},
                {"Fx|Ambisonics|Network", 0x4010000},
                {"||EQ|", 0x10},
                {"Fx|EQ|Dynamics", 0x18},
                {"Fx|Analyzer", 0x1000000}};
    for (const auto &row : rows)
        EXPECT_EQ(CategoryTable::instance().categoryToMask(categoryFromSubCategories(row.text)), row.mask)
            << row.text;
    EXPECT_TRUE(isInstrumentCategory(categoryFromSubCategories("Fx|Piano")));
    EXPECT_FALSE(isInstrumentCategory(categoryFromSubCategories("Fx|Delay")));
}
