#pragma once

#include "Main/AudioEngineController/Effects/VST/VSTHostCallback.h"
#include "Main/AudioEngineController/Effects/VST/VSTHostContext.h"
#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST2Fixture.h"

#include <gtest/gtest.h>

#include <thread>

/// Loads scripted plug-ins for use and notes what they are called.
class VSTInstanceBench : public testing::Test {
protected:
    /// With the first thread the thread sanitizer starts one of its own, which would count as the plug-in's.
    static void SetUpTestSuite()
    {
        std::thread([] {}).join();
    }

    static constexpr AudioSettings kSettings = {48000, 64};

    /// The script's first statement.
    QByteArray tracing() const { return "trace \"" + m_folder.path("trace").toUtf8() + "\"\n"; }
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
    QString takeTrace() const
    {
        const QStringList lines = m_folder.lines("trace");
        m_folder.write("trace", {});
        return lines.join("; ").remove(" Comp");
    }

    TestFolder m_folder;
    const CapturedLog m_log;
};
