#pragma once

#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostCallback.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostContext.h"
#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"
#include "Tests/Support/PluginBench.h"
#include "Tests/Support/VST2Fixture.h"

/// Loads scripted plug-ins for use.
class VSTInstanceBench : public PluginBench {
protected:
    static constexpr AudioSettings kSettings = {48000, 64};

    EffectRecord record(const char *file, const QByteArray &script)
    {
        EffectRecord record;
        record.path = addVST2File(m_folder.plugins(), file, tracing() + script);
        return record;
    }
    /// A plug-in of that script, loaded; the calls of loading are forgotten.
    std::unique_ptr<VSTPlugin> loaded(const QByteArray &script, const char *file = "Comp")
    {
        auto plugin = std::make_unique<VSTPlugin>();
        EXPECT_TRUE(plugin->load(record(file, script), VSTHostCallback, 0));
        takeTrace();
        return plugin;
    }
    /// The calls since the last time, without the plug-in's name where it is "Comp".
    QString takeTrace() const { return PluginBench::takeTrace().remove(" Comp"); }
};
