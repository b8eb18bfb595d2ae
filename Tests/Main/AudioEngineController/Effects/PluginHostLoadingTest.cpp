#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST2Fixture.h"
#include "Tests/Support/VST3Fixture.h"

#include <gtest/gtest.h>

TEST(PluginHostLoading, ThePrefixDecidesTheHost)
{
    const TestFolder folder;
    PluginHost registry;
    const auto list = [](AudioPluginHost &host, const QString &path, const char *id, bool enabled = true) {
        EffectRecord record;
        record.path = path;
        record.name = record.id = id;
        record.enabled = enabled;
        EXPECT_TRUE(host.AddEffect(record));
    };
    const char *const good = "00112233445566778899AABBCCDDEEFF";
    const char *const throws = "EE112233445566778899AABBCCDDEEFF";
    const QString vst3 = addVST3File(folder.plugins(), "C",
                                     QByteArray("class C\nid ") + good + "\nclass T\nid " + throws +
                                         "\nfault initialize throw-int T\n");
    list(registry.host(PluginFormat::Vst3), vst3, good);
    list(registry.host(PluginFormat::Vst3), vst3, throws);
    list(registry.host(PluginFormat::Vst3), vst3, "FF112233445566778899AABBCCDDEEFF");
    list(registry.host(PluginFormat::Vst3), vst3, "Off", false);
    list(registry.host(PluginFormat::BuiltIn), QString(), "a");
    list(registry.host(PluginFormat::Vst2), addVST2File(folder.plugins(), "Q", "name Q\nid 7\n"), "Q:7");
    const struct {
        const char *identifier;
        const char *loaded; // the identifier of what came; null: nothing
        bool isKnown;
    } cases[] = {{"vst3:00112233445566778899AABBCCDDEEFF", "vst3:00112233445566778899AABBCCDDEEFF", true},
                 {"vst2:Q:7", "vst2:Q:7", true},
                 {"vst2:Waves Q:7", "vst2:Q:7", true},
                 {"placeholder:vst2:Gone:1", "placeholder:vst2:Gone:1", true},
                 {"vst3:FF112233445566778899AABBCCDDEEFF", nullptr, true},
                 {"vst3:Off", nullptr, true},
                 {"vst3:EE112233445566778899AABBCCDDEEFF", nullptr, true},
                 {"mrl:a", nullptr, true},
                 {"vst3:Q:7", nullptr, false},
                 {"vst2:00112233445566778899AABBCCDDEEFF", nullptr, false},
                 {"Q:7", nullptr, false},
                 {"mrl:Q:7", nullptr, false},
                 {"placeholder:", nullptr, false},
                 {"", nullptr, false}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.identifier);
        const CapturedLog log;
        const auto plugin = registry.LoadPlugin(row.identifier);
        EXPECT_EQ(plugin ? plugin->identifier() : QString(), row.loaded);
        EXPECT_EQ(log.lines().contains(QLatin1String("PluginHost::LoadPlugin - Failed to Find Effect: ") +
                                       row.identifier),
                  !row.isKnown);
        EXPECT_TRUE(plugin || !log.lines().isEmpty()) << "the log says why";
        PluginPreset preset;
        if (plugin && plugin->StorePreset(preset)) {
            preset.identifier = row.identifier;
            EXPECT_TRUE(plugin->LoadPreset(preset)) << "one of the name asked for goes in";
        }
    }
}

TEST(PluginHostLoading, APlaceholderKeepsTheStateOfWhatIsMissing)
{
    PluginHost registry;
    const auto plugin = registry.LoadPlugin("placeholder:vst2:Gone:1");
    ASSERT_TRUE(plugin);
    PluginPreset preset;
    EXPECT_FALSE(plugin->StorePreset(preset)) << "nothing was given to keep";
    preset.identifier = "vst2:Gone:2";
    EXPECT_FALSE(plugin->LoadPreset(preset)) << "of another";
    preset.identifier = "vst2:Gone:1";
    preset.data = QByteArray("a\0b", 3);
    preset.name = "Gone";
    preset.flags = 0x12C0007;
    preset.firstChannels = {2, -5};
    preset.channelSpans = {4, 2147483647};
    EXPECT_TRUE(plugin->LoadPreset(preset));
    PluginPreset kept;
    EXPECT_TRUE(plugin->StorePreset(kept));
    EXPECT_EQ(kept.data, preset.data);
    EXPECT_EQ(kept.identifier, preset.identifier);
    EXPECT_EQ(kept.flags, preset.flags);
    EXPECT_EQ(kept.channelSpans, preset.channelSpans);
    EXPECT_EQ(plugin->name(), "Gone");
    EXPECT_EQ(plugin->channels().inputs.first, 2);
    EXPECT_EQ(plugin->channels().inputs.span(), 4);
    EXPECT_EQ(plugin->channels().outputs.span(), AudioPlugin::kMaxChannels) << "what a file says is checked";
}
