#include "Main/AudioEngineController/Effects/PluginHost.h"

#include "Main/AudioEngineController/Effects/Host/MRLAudioPluginHost.h"
#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostContext.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/TestApplication.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST2Fixture.h"
#include "Tests/Support/VST3Fixture.h"

#include <QDir>

#include <gtest/gtest.h>

TEST(PluginHost, AScanWritesItsFilesAndSaysSoAndARefreshDoesNot)
{
    const TestFolder data;
    const TestApplication application({data.plugins()});
    PluginHost registry;
    registry.initialise(data.dataFolder(), QString(), 96000, 512);
    EXPECT_EQ(registry.completionEvent(), nullptr);
    const CapturedLog log;
    registry.Scan(false, true);
    EXPECT_TRUE(registry.completionEvent()->isSet());
    EXPECT_EQ(application.changes, 0);
    EXPECT_TRUE(registry.Scan(true, true));
    EXPECT_TRUE(registry.completionEvent()->isSet());
    EXPECT_TRUE(log.contains("Plugin Scan Complete"));
    EXPECT_EQ(application.changes, 1);
    EXPECT_EQ(registry.pluginMetadataFolder(), data.dataFolder() + "/Plugin Metadata");
    EXPECT_EQ(QDir(data.effects()).entryList(QDir::Files),
              QStringList({"FXConfiguration.xml", "FXScan.xml", "VST3Configuration.xml"}));
}

TEST(PluginHost, AudioSettingsReachTheHosts)
{
    PluginHost registry;
    const VSTHostContext &vst2 = VSTHostContext::instance();
    registry.initialise("/nowhere", QString(), 48000, 1024);
    EXPECT_EQ(vst2.sampleRate(), 48000);
    EXPECT_EQ(vst2.blockSize(), 1024);
    registry.setIntParameter(IntParameter::BlockSize, 64);
    EXPECT_EQ(vst2.sampleRate(), 48000);
    EXPECT_EQ(vst2.blockSize(), 64);
}

TEST(PluginHost, MovingTheOldEffectsFolder)
{
    const struct {
        const char *name;
        bool oldHasCatalogue;
        const char *newFolder; ///< data folder, below the test's
        const char *there;     ///< the catalogue in it before
        QByteArray expected;   ///< and afterwards
        bool oldRemains;
    } rows[] = {
        {"moved and removed", true, "new", nullptr, "old", false},
        {"nothing to move, nothing removed", false, "new", nullptr, "", true},
        {"never over an existing file", true, "new", "new", "new", true},
        {"the new folder inside the old one", true, "old/Effects/inner", nullptr, "old", true},
        {"the same folder", true, kPathCase == Qt::CaseSensitive ? "old" : "OLD", nullptr, "old", true},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        const TestFolder test;
        test.write("old/Effects/sub/file", "x");
        if (row.oldHasCatalogue)
            test.write("old/Effects/FXConfiguration.xml", "old");
        const QString moved = test.path(row.newFolder) + "/Effects/FXConfiguration.xml";
        if (row.there)
            test.write(moved, row.there);
        const CapturedLog log;
        PluginHost().initialise(test.path(row.newFolder), test.path("old/Effects"), 48000, 1024);
        EXPECT_EQ(test.read(moved), row.expected);
        EXPECT_EQ(QDir(test.path("old/Effects")).exists(), row.oldRemains);
    }
}

TEST(PluginHost, MarksOnBuiltInEffectsAreReadAndWritten)
{
    const TestFolder folder;
    const QString file = "Effects/TesselFXConfiguration.xml";
    const QByteArray start = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<Effects version=\"1.2\">\n";
    const auto block = [](const char *id, const char *favourite, const char *mask) {
        return QByteArray("\t<Effect>\n\t\t<ID>") + id + "</ID>\n\t\t<Favourite>" + favourite +
               "</Favourite>\n\t\t<CategoryMask>" + mask + "</CategoryMask>\n\t</Effect>\n";
    };
    folder.write(file, start + block("gone", "1", "0") + block("b", "-5", "2") + block("", "1", "0") +
                           "</Effects>\n");
    TestApplication application({}, true);
    MRLAudioPluginHost host;
    host.setCatalogueFolder(folder.effects());
    std::vector<EffectRecord> effects(2);
    effects[0].id = effects[0].name = "a";
    effects[0].category = 0x40; // Delay
    effects[1].id = effects[1].name = "b";
    const CapturedLog log;
    host.ReadCatalogue();
    EXPECT_EQ(log.lines(), QStringList()) << "nothing is lost where there are no effects";
    host.setBuiltInEffects(effects);
    EXPECT_FALSE(host.catalogueChanged()) << "it was just read";
    EXPECT_TRUE(host.findEffect("b")->favourite);
    EXPECT_EQ(host.findEffect("b")->category, 0u) << "the mask is written only";
    EXPECT_EQ(log.count("is passed over"), 2);
    EXPECT_TRUE(log.contains("gone is passed over"));

    EXPECT_FALSE(host.setFavourite("a", true));
    EXPECT_TRUE(folder.read(file).contains("gone")) << "not written by the scanner";
    application.scanner = false;
    EXPECT_FALSE(host.setFavourite("gone", true));
    MRLAudioPluginHost without;
    without.setCatalogueFolder(folder.effects());
    EXPECT_FALSE(without.writeMarks());
    EXPECT_TRUE(folder.read(file).contains("gone")) << "no effects take no marks away";
    EXPECT_TRUE(host.setFavourite("b", false));
    EXPECT_EQ(folder.read(file).replace("\r\n", "\n"),
              start + block("a", "1", "4") + block("b", "0", "0") + "</Effects>\n");
    host.setBuiltInEffects(effects);
    EXPECT_TRUE(host.findEffect("a")->favourite) << "the marks outlive new effects";
}

TEST(PluginHostLoading, ThePrefixDecidesTheHostAndTheKeyThePlugin)
{
    const TestFolder folder;
    PluginHost registry;
    const auto list = [&](PluginFormat format, const char *id, const QByteArray &script = "",
                          bool isEnabled = true, qint32 category = 1) {
        EffectRecord record;
        const QString file = QString(id).remove(':');
        record.path = format == PluginFormat::Vst3 ? addVST3File(folder.plugins(), file, script)
                                                   : addVST2File(folder.plugins(), file, script);
        record.name = record.id = id;
        record.enabled = isEnabled;
        record.vstCategory = category;
        EXPECT_TRUE(registry.host(format).AddEffect(record)) << id;
    };
    list(PluginFormat::Vst3, "00112233445566778899AABBCCDDEEFF",
         "class C\nid 00112233445566778899AABBCCDDEEFF\n");
    list(PluginFormat::Vst3, "EE112233445566778899AABBCCDDEEFF",
         "class T\nid EE112233445566778899AABBCCDDEEFF\nfault initialize throw-int\n");
    list(PluginFormat::Vst3, "FF112233445566778899AABBCCDDEEFF");
    list(PluginFormat::Vst3, "Off", "", false);
    list(PluginFormat::BuiltIn, "a");
    list(PluginFormat::Clap, "com.a.B");
    list(PluginFormat::Vst2, "Q10:7", "name Q10\nid 7\n");
    list(PluginFormat::Vst2, "ves Q10:8", "name \"ves Q10\"\nid 8\n");
    list(PluginFormat::Vst2, "Off", "", false);
    list(PluginFormat::Vst2, "Line", "", true, 9);
    list(PluginFormat::Vst2, "Broken", "answer entry null");
    const struct {
        const char *identifier;
        const char *loaded; // the identifier of what came; null: nothing
        bool isKnown;
    } rows[] = {{"vst3:00112233445566778899AABBCCDDEEFF", "vst3:00112233445566778899AABBCCDDEEFF", true},
                {"vst2:Q10:7", "vst2:Q10:7", true},
                {"vst2:Waves Waves Q10:7", "vst2:Q10:7", true},
                {"vst2:Old Waves Q10:8", "vst2:ves Q10:8", true},
                {"placeholder:vst2:Gone:1", "placeholder:vst2:Gone:1", true},
                {"clap:com.a.B", "placeholder:clap:com.a.B", true}, // listed only
                {"clap:com.a", nullptr, false},
                {"vst3:FF112233445566778899AABBCCDDEEFF", nullptr, true},
                {"vst3:EE112233445566778899AABBCCDDEEFF", nullptr, true},
                {"vst3:Off", nullptr, true},
                {"vst2:Off", nullptr, true},
                {"vst2:Line", nullptr, true},
                {"vst2:Broken", nullptr, true},
                {"mrl:a", nullptr, true},
                {"vst2:Waves ", nullptr, false},
                {"vst2:Waves", nullptr, false},
                {"vst3:Q10:7", nullptr, false},
                {"vst2:00112233445566778899AABBCCDDEEFF", nullptr, false},
                {"Q10:7", nullptr, false},
                {"mrl:Q10:7", nullptr, false},
                {"placeholder:", nullptr, false},
                {"", nullptr, false}};
    for (const auto &row : rows) {
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
    const auto first = registry.LoadPlugin("vst2:ves Q10:8"), second = registry.LoadPlugin("vst2:Q10:7");
    const CapturedLog log;
    VSTHostContext::instance().logLoadedPlugins();
    EXPECT_EQ(log.lines(), QStringList({"VSTs ", "vst: ves Q10: ", "vst: Q10: "}));
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
