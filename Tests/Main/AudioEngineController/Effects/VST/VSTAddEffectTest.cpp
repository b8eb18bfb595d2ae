#include "Core/BaseLib/Binary/PluginLibrary.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

#include <utility>

TEST(WaveShellVersion, IsReadFromNamesOfTheOnePattern)
{
    const std::pair<const char *, double> rows[] = {
        {"WaveShell10-VST 10.25_x64", 10.25}, {"WaveShell1-VST 12_x64", 12.0},
        {"WaveShell1-VST 9,3_x64", 0.0},      {"WaveShell1-VST nan_x64", 0.0},
        {"My WaveShell1-VST 9.3_x64", 0.0},   {"WaveShell1-VST 9.3_x64 copy", 0.0}};
    for (const auto &[name, version] : rows)
        EXPECT_EQ(waveShellVersion(name + PluginLibrary::fileEnding()), version) << name;
    EXPECT_EQ(waveShellVersion("WaveShell1-VST 9.3_x64.vst3"), 0.0);
}

TEST(VSTAddEffect, OfTwoSpecialShellsTheNewerStays)
{
    const char *const old = "WaveShell1-VST 9.2_x64";
    const char *const newer = "WaveShell1-VST 9.3_x64";
    const struct {
        const char *name, *first, *second;
        bool replaces;
    } rows[] = {{"newer after older", old, newer, true},
                {"older after newer", newer, old, false},
                {"same version", newer, "WaveShell2-VST 9.3_x64", false},
                {"compared as numbers", newer, "WaveShell1-VST 10.1_x64", true},
                {"without a version after one with", old, "WaveShell", false},
                {"with a version after one without", "WaveShell", old, true},
                {"the rule is for the later one's path", "Other", newer, true},
                {"another file after a shell", old, "Other", false}};
    for (const auto &row : rows) {
        VSTHost host;
        EffectRecord record;
        record.id = record.name = "Q10";
        const auto add = [&](const char *file) {
            record.path = QStringLiteral("/fx/") + file + PluginLibrary::fileEnding();
            return host.AddEffect(record);
        };
        EXPECT_TRUE(add(row.first)) << row.name;
        const QString first = record.path;
        EXPECT_EQ(add(row.second), row.replaces) << row.name;
        ASSERT_EQ(host.effects().size(), 1u) << row.name;
        EXPECT_EQ(host.effects()[0].path, row.replaces ? record.path : first) << row.name;
    }
}
