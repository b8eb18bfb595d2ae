#include "Core/BaseLib/Binary/PluginLibrary.h"
#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"
#include "Main/AudioEngineController/Effects/PluginHost.h"
#include "Main/AudioEngineController/Effects/VST3/VST3ModuleFile.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/RealPlugins.h"
#include "Tests/Support/TestApplication.h"
#include "Tests/Support/TestFolder.h"

#include <QDir>

#include <gtest/gtest.h>

#include <cmath>

// Takes Debian's plug-ins through their use: loaded by identifier, opened, run, their
// state stored and loaded, closed. Plug-ins of other folders: FXPROBE_TOUR_VST3 and FXPROBE_TOUR_VST.

namespace {

class InstanceTour : public testing::Test {
protected:
    /// Lists what is in a folder, and keeps the modules in memory for the rest of the process if that is
    /// asked for.
    void list(const QString &folder, const QStringList &patterns)
    {
        if (qEnvironmentVariableIsSet("FXPROBE_TOUR_KEEPS_MODULES"))
            for (const QFileInfo &file : QDir(folder).entryInfoList(patterns)) {
                QString reason;
                PluginLibrary library;
                const QString path = file.filePath();
                if (library.load(file.isDir() ? VST3ModuleFile::binary(path, reason) : path))
                    library.leaveMapped();
            }
        const TestApplication application({folder}, true);
        m_registry.initialise(m_folder.dataFolder(), QString(), 48000, 256);
        m_registry.Scan(true, true);
    }

    void tour(AudioPluginHost &host, const QString &prefix)
    {
        const std::vector<EffectRecord> records = host.effects();
        for (const EffectRecord &record : records) {
            SCOPED_TRACE(record.path.toStdString());
            const auto plugin = m_registry.LoadPlugin(prefix + record.id);
            ASSERT_TRUE(plugin) << m_log.lines().join('\n').toStdString();
            EXPECT_EQ(plugin->identifier(), prefix + record.id);
            use(*plugin);
        }
        if (records.empty())
            GTEST_SKIP() << "Debian's zam-plugins and dpf-plugins-vst are not installed";
    }

    void use(AudioPlugin &plugin)
    {
        ASSERT_TRUE(plugin.open({48000, 256}));
        ASSERT_TRUE(plugin.start());
        process(plugin);
        PluginPreset stored;
        ASSERT_TRUE(plugin.StorePreset(stored));
        EXPECT_TRUE(plugin.LoadPreset(stored)) << m_log.lines().last().toStdString();
        process(plugin);
        PluginPreset again;
        EXPECT_TRUE(plugin.StorePreset(again));
        EXPECT_EQ(again.data, stored.data) << "the same bytes";
        EXPECT_TRUE(plugin.setAudioSettings({96000, 64}));
        process(plugin);
        plugin.close();
        EXPECT_FALSE(plugin.isRunning());
    }

    /// A block of one loud sample; what comes out must be numbers.
    static void process(AudioPlugin &plugin)
    {
        ChannelBuffers &buffers = plugin.buffers();
        for (std::size_t channel = 0; channel < buffers.inputCount(); ++channel)
            buffers.inputs()[channel][0] = 0.9f;
        ASSERT_TRUE(plugin.process(buffers.frames()));
        for (std::size_t channel = 0; channel < buffers.outputCount(); ++channel)
            EXPECT_TRUE(std::isfinite(buffers.outputs()[channel][buffers.frames() - 1]));
    }

    const CapturedLog m_log;
    TestFolder m_folder;
    PluginHost m_registry;
};

} // namespace

TEST_F(InstanceTour, OfTheVST3Plugins)
{
    list(qEnvironmentVariable("FXPROBE_TOUR_VST3", realPlugins(m_folder) + "/vst3"), {"*.vst3"});
    tour(m_registry.host(PluginFormat::Vst3), "vst3:");
}

TEST_F(InstanceTour, OfTheVST2Plugins)
{
    list(qEnvironmentVariable("FXPROBE_TOUR_VST", realPlugins(m_folder) + "/vst"), {"*.so", "*.dll"});
    tour(m_registry.host(PluginFormat::Vst2), "vst2:");
}
