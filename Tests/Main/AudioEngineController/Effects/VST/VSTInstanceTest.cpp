#include "Tests/Main/AudioEngineController/Effects/VST/VSTInstanceBench.h"

#include "Main/AudioEngineController/Effects/VST/Interface/VSTCallbackNesting.h"

#include <functional>
#include <future>

namespace {

/// The calls of an opening.
const QString kOpened = "open; opcode-10: 48000; opcode-11: 0 64; opcode-61: 0 2; opcode-51; opcode-51";

using VSTInstance = VSTInstanceBench;

/// Notes what it hears; for a change of channels, what the plug-in was called before, and its state.
struct Listener final : IAudioPluginListener {
    void pluginChanged(AudioPlugin &plugin) noexcept override
    {
        heard << QStringLiteral("%1 | %2 outputs").arg(trace()).arg(plugin.channels().outputs.span());
        EXPECT_FALSE(plugin.isRunning());
    }
    void displayChanged(AudioPlugin &) noexcept override { heard << "display"; }
    void parameterChanged(AudioPlugin &plugin, quint32 id, double value) noexcept override
    {
        heard << QStringLiteral("parameter %1 %2").arg(id).arg(value);
        auto span = std::async(std::launch::async, [&] { return plugin.channels().outputs.span(); });
        EXPECT_EQ(span.wait_for(std::chrono::seconds(5)), std::future_status::ready) << "waits for the block";
    }
    void parameterEdit(AudioPlugin &, quint32 id, bool begins) noexcept override
    {
        heard << QStringLiteral("edit %1 %2").arg(id).arg(begins);
    }
    bool resizeEditor(AudioPlugin &, int width, int height) noexcept override
    {
        heard << QStringLiteral("size %1 %2").arg(width).arg(height);
        return true;
    }

    std::function<QString()> trace = [] { return QString(); };
    QStringList heard;
};

} // namespace

TEST_F(VSTInstance, LoadingClosesWhatWasHeldOrLogsWhyItFails)
{
    EffectRecord shell = record(
        "Shell",
        "child 11 A\nchild 12 B\nchild 13 C\nchild 14 D\nfault entry throw-std C\nanswer entry same D");
    const EffectRecord null = record("Null", "answer entry null"), strange = record("Strange", "magic 1");
    const QString asked = "; get-plug-category%1; get-effect-name%1";
    VSTPlugin plugin;
    // Whether it loads, which takes one line of the log where it does not, and what is called.
    const auto load = [&](EffectRecord record, quint32 subId, int mode, bool isLoaded, const QString &calls) {
        const CapturedLog log;
        record.subId = subId;
        EXPECT_EQ(plugin.load(record, VSTHostCallback, mode), isLoaded) << calls.toStdString();
        EXPECT_EQ(takeTrace().remove(" Shell"), calls);
        EXPECT_EQ(log.contains("VSTPlugin::Load - "), !isLoaded) << calls.toStdString();
        EXPECT_EQ(VSTHostContext::instance().ownerBeingLoaded(), nullptr);
    };
    load(shell, 0, 0, true, "static-constructor; entry" + asked.arg(""));
    load(shell, 11, 1, true, "entry A: 11" + asked.arg(" A"));
    load(shell, 14, 1, true, "entry D: 14" + asked.arg("")); // closed once
    load(shell, 12, 0, true,
         "close A; close; static-destructor; static-constructor; entry B: 12" + asked.arg(" B"));
    load(shell, 13, 1, false, "entry C: 13; close B; static-destructor");
    load(null, 0, 0, false, "static-constructor; entry Null");
    load(strange, 0, 0, false, "static-destructor; static-constructor; entry Strange");
    load(shell, 11, 0, true, "static-destructor: 1 open; static-constructor; entry A: 11" + asked.arg(" A"));
    EXPECT_EQ(plugin.shellId(), 11);
}

TEST_F(VSTInstance, IsSentWhatItsUseForAudioTakes)
{
    auto plugin = loaded("inputs 1\neditor\nanswer opcode-51 1\nparameter Gain 0.5\n"
                         "ask-host process 14\nanswer opcode-53 1\n");
    const auto expect = [this](bool succeeds, const QString &calls) {
        EXPECT_TRUE(succeeds) << calls.toStdString();
        EXPECT_EQ(takeTrace(), calls);
    };
    const AudioSettings slower = {44100, 64}, smaller = {44100, 32};
    const auto events = std::make_unique<VstEvents>();
    int window = 0;
    const QString stopped = "opcode-72; mains-changed", started = "mains-changed: 0 1; opcode-71";
    const QString reopened = QString(kOpened).remove("open; ").replace("48000", "44100");
    // Every operation in the order of a life, and the calls that the plug-in sees.
    expect(!plugin->start() && !plugin->UpdateSpeakerArrangement(2, 2, true), "");
    expect(plugin->open(kSettings), kOpened);
    expect(plugin->start(), started);
    expect(!plugin->process(65), "");
    expect(plugin->process(64), "process: 64; host-14: 1");
    plugin->idle();
    expect(true, "opcode-53");
    expect(plugin->setAudioSettings(slower), stopped + "; opcode-10: 44100; opcode-11: 0 64; " + started);
    expect(plugin->setAudioSettings(smaller), stopped + "; opcode-11: 0 32; " + started);
    expect(plugin->programs().set(0), "opcode-67; opcode-2; opcode-68");
    expect(plugin->programs().name().isEmpty(), "opcode-5");
    expect(plugin->setBypass(true), "opcode-44: 0 1");
    expect(plugin->processEvents(*events), "opcode-25");
    expect(plugin->editor().rect() == QRect(0, 0, 300, 200), "opcode-13");
    expect(plugin->openEditor(&window), "opcode-13; opcode-14");
    plugin->idle();
    expect(true, "opcode-53; edit-idle");
    plugin->setTotalSamples(7);
    expect(true, "opcode-73: 0 7");
    plugin->close();
    expect(!plugin->UpdateSpeakerArrangement(2, 2, true), "opcode-15; " + stopped);
    expect(plugin->open(slower) && plugin->start(), reopened + "; opcode-44: 0 1; " + started);
    plugin.reset();
    expect(true, stopped + "; close; static-destructor");
}

TEST_F(VSTInstance, ABlockGoesThroughTheBuffers)
{
    for (const char *flags : {"flags 0x10", "flags 0"}) { // replaces; adds to the outputs
        auto plugin = loaded(QByteArray("inputs 1\n") + flags);
        ASSERT_TRUE(plugin->open(kSettings) && plugin->start());
        for (int block = 0; block < 2; ++block) {
            plugin->buffers().inputs()[0][63] = 0.25f;
            ASSERT_TRUE(plugin->process(64));
            EXPECT_EQ(plugin->buffers().outputs()[0][63], 0.25f) << flags;
            EXPECT_EQ(plugin->buffers().outputs()[1][63], 1.0f) << flags;
        }
    }
    // Counts that cannot be, and such as change behind the host's back.
    for (const char *script : {"outputs -1", "inputs 2147483647", "set process inputs 3"}) {
        auto plugin = loaded(script);
        EXPECT_TRUE(plugin->open(kSettings)) << script;
        EXPECT_FALSE(plugin->start() && plugin->process(64) && plugin->process(64)) << script;
    }
}

TEST_F(VSTInstance, ListenersHearWhatThePluginTells)
{
    // What happens; the script; whether in a block, else when a program is set; what is heard: at each change
    // of channels the calls before it, and the state; the calls after the last.
    const char *const rows = R"(
channels changed in a block: after it ~ set process outputs 5 / ask-host process 13 ~ block ~ process: 1; host-13: 0; opcode-72; mains-changed | 5 outputs ~ mains-changed: 0 1; opcode-71
again while it is stopped for that ~ set opcode-2 outputs 5 / ask-host opcode-2 13 / ask-host opcode-72 13 ~ ~ opcode-67; opcode-2; opcode-72 | 5 outputs / host-13: 0; mains-changed | 5 outputs ~ mains-changed: 0 1; opcode-71; host-13: 0; opcode-68
to what nobody has ~ set opcode-2 outputs 2147483647 / ask-host opcode-2 13 ~ ~ opcode-67; opcode-2; opcode-72; mains-changed | 2147483647 outputs ~ host-13: 0; opcode-68
no size without an editor ~ ask-host process 0 index 3 opt 0.5 / ask-host process 43 index 3 / ask-host process 44 index 3 / ask-host process 42 / ask-host process 15 index 640 value 480 ~ block ~ parameter 3 0.5 / edit 3 1 / edit 3 0 / display ~ process: 1; host-0: 0; host-43: 1; host-44: 1; host-42: 1; host-15: 0
a size ~ editor / ask-host process 15 index 640 value 480 ~ block ~ size 640 480 ~ process: 1; host-15: 1
)";
    for (const QStringList &row : rowsOf(rows)) {
        SCOPED_TRACE(row[0].toStdString());
        auto plugin = loaded(scriptIn(row[1]));
        Listener listener;
        listener.trace = [this] { return takeTrace(); };
        plugin->addListener(&listener);
        plugin->addListener(&listener); // each tells once
        ASSERT_TRUE(plugin->open(kSettings) && plugin->start());
        plugin->openEditor(&listener);
        takeTrace();
        EXPECT_TRUE(row[2] == "block" ? plugin->process(1) : plugin->programs().set(0));
        EXPECT_EQ(takeTrace(), row[4]);
        EXPECT_EQ(listener.heard.join(" / "), row[3]);
        plugin->removeListener(&listener);
        listener.heard.clear();
        plugin->process(1);
        EXPECT_EQ(listener.heard, QStringList());
    }
    // Also all the time, from a thread of the plug-in, but not while it is torn down.
    auto plugin = loaded("set opcode-71 outputs 5\nask-host open 13 until-close\nask-host close 13");
    ASSERT_TRUE(plugin->open(kSettings));
    for (int round = 0; round < 50; ++round) {
        ASSERT_TRUE(plugin->start());
        plugin->process(64);
        plugin->stop();
    }
    plugin->start();
    plugin.reset();
    EXPECT_TRUE(takeTrace().endsWith("; mains-changed; close; host-13: 0; static-destructor"));
}

TEST_F(VSTInstance, AFaultEndsTheUse)
{
    for (const auto &[stage, calls] :
         {std::pair("open", QString("open")),
          {"process", kOpened + "; mains-changed: 0 1; opcode-71; process: 64"}}) {
        SCOPED_TRACE(stage);
        auto plugin = loaded(QByteArray("name Comp\nfault ") + stage + " segv", stage);
        EXPECT_FALSE(plugin->open(kSettings) && plugin->start() && plugin->process(64));
        EXPECT_FALSE(plugin->isRunning() || plugin->programs().set(0) || plugin->setBypass(true) ||
                     plugin->start());
        plugin.reset();
        EXPECT_EQ(takeTrace(), calls);
    }
    EXPECT_EQ(m_log.count("Exception Caught in VST Plugin"), 1);
    AEffect effect = {};
    effect.dispatcher = [](AEffect *, int, int, VstIntPtr, void *, float) -> VstIntPtr {
        VSTCallbackNesting::enter();
        throw std::runtime_error("thrown");
    };
    EXPECT_EQ(VSTEffect(&effect).dispatch(47), 0);
    EXPECT_EQ(VSTCallbackNesting::active(), 0) << "the calls that it skipped are not counted for ever";
    auto thrower = loaded("fault process throw-std");
    EXPECT_TRUE(thrower->open(kSettings) && thrower->start() && !thrower->process(64) && thrower->start())
        << "what throws is as it was";
}
