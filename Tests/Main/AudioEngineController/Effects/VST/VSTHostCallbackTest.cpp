#include "Main/AudioEngineController/Effects/VST/VSTHostCallback.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

#include <array>
#include <climits>
#include <map>
#include <thread>

namespace {

/// Calls of the host that an effect still has to make, each in the idle call that answers the one before.
thread_local int t_callsToNest = 0;
/// What the innermost of them was answered.
thread_local VstIntPtr t_innermostAnswer = -1;

VstIntPtr answerIdle(AEffect *effect, int opcode, int index, VstIntPtr value, void *ptr, float opt)
{
    EXPECT_EQ(opcode, VstPublished::effEditIdle);
    EXPECT_TRUE(index == 0 && value == 0 && ptr == nullptr && opt == 0.0f);
    if (--t_callsToNest > 0)
        return VSTHostCallback(effect, VstPublished::audioMasterIdle, 0, 0, nullptr, 0);
    t_innermostAnswer = VSTHostCallback(effect, audioMasterVersion, 0, 0, nullptr, 0);
    return 0;
}

AEffect effectWith(const void *owner)
{
    AEffect effect = {};
    effect.magic = kEffectMagic;
    effect.dispatcher = answerIdle;
    effect.numInputs = 2;
    effect.numOutputs = 3;
    effect.resvd1 = reinterpret_cast<VstIntPtr>(owner);
    return effect;
}

class VSTHostCallbackTest : public testing::Test {
protected:
    VSTHostCallbackTest()
    {
        VSTCallbackNesting::setActive(0);
        m_host.setIgnoredPlugin(&m_ignored);
    }
    ~VSTHostCallbackTest() override { VSTCallbackNesting::setActive(0); }

    static VstIntPtr call(AEffect *effect, VstInt32 opcode, VstInt32 index = 0, VstIntPtr value = 0,
                          void *ptr = nullptr)
    {
        t_callsToNest = 1;
        return VSTHostCallback(effect, opcode, index, value, ptr, 0.5f);
    }
    /// The answer to the innermost of so many active calls of one thread.
    static VstIntPtr answerAtDepth(int depth)
    {
        AEffect effect = effectWith(nullptr);
        t_callsToNest = depth - 1;
        t_innermostAnswer = -1;
        if (depth == 1)
            return call(nullptr, audioMasterVersion);
        VSTHostCallback(&effect, VstPublished::audioMasterIdle, 0, 0, nullptr, 0);
        return t_innermostAnswer;
    }

    const CapturedLog m_log;
    VSTHost m_host;
    VSTPlugin m_plugin{m_host};
    VSTPlugin m_ignored{m_host};
    AEffect m_strange = effectWith(&m_log);
    AEffect m_owned = effectWith(&m_plugin);
    AEffect m_ignoredEffect = effectWith(&m_ignored);
    AEffect *const m_askers[4] = {&m_owned, &m_ignoredEffect, &m_strange, nullptr};
};

} // namespace

TEST_F(VSTHostCallbackTest, EveryOpcodeHasItsAnswer)
{
    // All but those that have a test of their own; the others are answered 0.
    const std::map<int, VstIntPtr> answers = {{1, 2400}, {6, 1},  {11, 8192}, {14, 1}, {16, 44100}, {17, 256},
                                              {23, 1},   {32, 1}, {33, 1},    {34, 1}, {38, 1},     {42, 1}};
    std::vector<int> opcodes = {47, 48, 70, 128, 100003, INT_MAX, INT_MIN, -1};
    for (int opcode = 0; opcode <= 46; ++opcode)
        if (opcode != audioMasterCurrentId && opcode != VstPublished::audioMasterPinConnected &&
            opcode != audioMasterBeginEdit && opcode != audioMasterEndEdit)
            opcodes.push_back(opcode);
    for (const int opcode : opcodes)
        for (AEffect *effect : m_askers) {
            SCOPED_TRACE(opcode);
            const CapturedLog log;
            debugLogSettings().trace = true;
            std::array<char, 64> buffer = {};
            const VstIntPtr answer = call(effect, opcode, 0, 0, buffer.data());
            EXPECT_EQ(answer, answers.count(opcode) ? answers.at(opcode) : 0);
            EXPECT_TRUE(
                log.lines().first().startsWith(QStringLiteral("VST HostCallback(%1, 0, 0, 0x").arg(opcode)));
            EXPECT_EQ(log.lines().last(), QStringLiteral("VST HostCallback returned %1").arg(answer));
        }
    EXPECT_EQ(VSTCallbackNesting::active(), 0);
}

TEST_F(VSTHostCallbackTest, TraceLinesHoldAllArguments)
{
    VSTHostCallback(nullptr, audioMasterVersion, -7, VstIntPtr{0x100000005}, nullptr, 0.25f);
    EXPECT_EQ(m_log.lines(), QStringList());
    debugLogSettings().trace = true;
    VSTHostCallback(nullptr, audioMasterVersion, -7, VstIntPtr{0x100000005}, reinterpret_cast<void *>(0xAB),
                    0.25f);
    EXPECT_EQ(m_log.lines(),
              QStringList({"VST HostCallback(1, -7, 5, 0xab, 0.250000);", "VST HostCallback returned 2400"}));
}

TEST_F(VSTHostCallbackTest, PinsAreConnectedUpToTheEffectsCount)
{
    const struct {
        const char *name;
        VstInt32 index;
        VstIntPtr value, answer;
    } rows[] = {{"last input", 1, 0, 0},
                {"input behind the last", 2, 0, 1},
                {"last output", 2, 1, 0},
                {"output behind the last", 3, 1, 1},
                {"neither input nor output", 0, 2, 1},
                {"negative kind", 0, -1, 1},
                {"a kind beyond 32 bits", 0, VstIntPtr{1} << 32, 1}};
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        const CapturedLog log;
        debugLogSettings().trace = true;
        EXPECT_EQ(call(&m_owned, VstPublished::audioMasterPinConnected, row.index, row.value), row.answer);
        EXPECT_EQ(log.count("returned"), row.answer) << "a trace line or none";
        EXPECT_EQ(call(nullptr, VstPublished::audioMasterPinConnected, row.index, row.value), 1);
    }
}

TEST_F(VSTHostCallbackTest, CapabilitiesAreComparedExactly)
{
    const auto answerTo = [](const char *capability) {
        return call(nullptr, audioMasterCanDo, 0, 0, const_cast<char *>(capability));
    };
    for (const char *known : {"sendVstEvents", "sendVstMidiEvent", "shellCategory",
                              "sendVstMidiEventFlagIsRealtime", "sendVstTimeInfo", "startStopProcess",
                              "openFileSelector", "closeFileSelector", "supplyIdle", "sizeWindow"})
        EXPECT_EQ(answerTo(known), 1) << known;
    for (const char *unknown : {"SendVstEvents", "sendVstEvent", "sendVstEvents ", "receiveVstMidiEvent", ""})
        EXPECT_EQ(answerTo(unknown), 0) << unknown;
    EXPECT_EQ(answerTo(nullptr), 0);
}

TEST_F(VSTHostCallbackTest, TextsAreWrittenWithTheirZeroAndNothingMore)
{
    for (const auto &[opcode, text] : {std::pair(audioMasterGetVendorString, std::string("Tessel")),
                                       {audioMasterGetProductString, "Vantage II"}}) {
        std::string buffer(64, '\x5A');
        EXPECT_EQ(call(nullptr, opcode, 0, 0, buffer.data()), 1);
        EXPECT_EQ(buffer, text + '\0' + std::string(63 - text.size(), '\x5A'));
        EXPECT_EQ(call(nullptr, opcode, 0, 0, nullptr), 0) << "nowhere to write";
    }
}

TEST_F(VSTHostCallbackTest, SettingsAreTheHostsAndRealtimeIsTheCallingPlugins)
{
    m_host.setAudioSettings(-96000, 64);
    EXPECT_EQ(call(nullptr, audioMasterGetSampleRate), -96000);
    EXPECT_EQ(call(&m_owned, audioMasterGetBlockSize), 64);
    m_plugin.setRealtime(true);
    for (AEffect *effect : m_askers)
        EXPECT_EQ(call(effect, audioMasterGetCurrentProcessLevel), effect == &m_owned ? 2 : 1);
}

TEST_F(VSTHostCallbackTest, NotificationsReachTheCallingPluginOnly)
{
    const std::pair<VstInt32, bool (VSTPlugin::*)() const> rows[] = {
        {audioMasterWantMidi, &VSTPlugin::wantsMidi},
        {VstPublished::audioMasterNeedIdle, &VSTPlugin::needsIdle},
        {VstPublished::audioMasterIOChanged, &VSTPlugin::hasIoChanged}};
    for (const auto &[opcode, hasHappened] : rows) {
        call(nullptr, opcode);
        call(&m_strange, opcode);
        EXPECT_FALSE((m_plugin.*hasHappened)()) << opcode;
        call(&m_owned, opcode);
        EXPECT_TRUE((m_plugin.*hasHappened)()) << opcode;
        EXPECT_FALSE((m_ignored.*hasHappened)()) << opcode;
    }
    const QString line = "Host Callback - audioMasterIOChanged";
    EXPECT_EQ(m_log.lines(), QStringList({line, line})) << "for an effect of a plug-in or of none";
}

TEST_F(VSTHostCallbackTest, OnlyAPluginThatLivesMayEdit)
{
    for (const VstInt32 opcode : {audioMasterBeginEdit, audioMasterEndEdit}) {
        for (AEffect *effect : m_askers)
            EXPECT_EQ(call(effect, opcode), effect == &m_owned ? 1 : 0);
        auto passing = std::make_unique<VSTPlugin>(m_host);
        AEffect effect = effectWith(passing.get());
        EXPECT_EQ(call(&effect, opcode), 1);
        passing.reset();
        EXPECT_EQ(call(&effect, opcode), 0);
        EXPECT_EQ(call(&effect, audioMasterCurrentId), 0);
    }
}

TEST_F(VSTHostCallbackTest, CurrentIdIsThatOfThePluginBeingLoadedElseOfTheCallingOne)
{
    VSTPlugin loading(m_host);
    EffectRecord record; // a failed load leaves the object with its identifier
    record.subId = 0x80000001;
    EXPECT_FALSE(m_plugin.load(record, VSTHostCallback, 0));
    record.subId = 11;
    EXPECT_FALSE(loading.load(record, VSTHostCallback, 0));
    debugLogSettings().trace = true;
    const struct {
        VSTPlugin *loading;
        AEffect *effect;
        VstIntPtr answer;
    } cases[] = {{nullptr, nullptr, 0},
                 {nullptr, &m_strange, 0},
                 {nullptr, &m_owned, -0x7FFFFFFF}, // sign-extended
                 {&loading, nullptr, 11},
                 {&loading, &m_owned, 11},
                 {&m_ignored, &m_owned, 0}}; // one without an identifier is loaded
    for (const auto &row : cases) {
        m_host.setPluginBeingLoaded(row.loading);
        EXPECT_EQ(call(row.effect, audioMasterCurrentId), row.answer) << &row - cases;
    }
    EXPECT_EQ(m_log.count("returned"), 0) << "it has no such line";
}

TEST_F(VSTHostCallbackTest, TheEleventhNestedCallOfAThreadIsRefused)
{
    EXPECT_EQ(answerAtDepth(1), 2400);
    EXPECT_EQ(answerAtDepth(10), 2400);
    EXPECT_EQ(m_log.lines(), QStringList());
    EXPECT_EQ(answerAtDepth(11), 0);
    EXPECT_EQ(m_log.lines(), QStringList("VSTHost::HostCallback: Exceeded max Reentrancy: 11 of 10"));
    EXPECT_EQ(VSTCallbackNesting::active(), 0);
    EXPECT_EQ(answerAtDepth(10), 2400) << "a refusal leaves nothing behind";
    VSTCallbackNesting::setActive(10);
    VstIntPtr answer = 0;
    std::thread([&answer] { answer = answerAtDepth(10); }).join();
    EXPECT_EQ(answer, 2400);
    EXPECT_EQ(call(nullptr, audioMasterVersion), 0);
}

TEST_F(VSTHostCallbackTest, ACounterThatRanAwayIsSetBack)
{
    const struct {
        std::int32_t before;
        VstIntPtr answer;
        std::int32_t after;
    } cases[] = {{9, 2400, 9},        {10, 0, 10},    {4094, 0, 4094}, {4095, 2400, -1},
                 {1000000, 2400, -1}, {-1, 2400, -1}, {-3, 0, -3}};
    for (const auto &row : cases) {
        VSTCallbackNesting::setActive(row.before);
        EXPECT_EQ(call(nullptr, audioMasterVersion), row.answer) << row.before;
        EXPECT_EQ(VSTCallbackNesting::active(), row.after) << row.before;
    }
}
