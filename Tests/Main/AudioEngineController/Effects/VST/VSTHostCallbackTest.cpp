#include "Main/AudioEngineController/Effects/VST/VSTHostCallback.h"

#include "Core/BaseLib/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTPlugin.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

#include <array>
#include <climits>
#include <cstring>
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
    /// Makes the object stand for a sub-plug-in: a failed load leaves it with the identifier.
    static void standFor(VSTPlugin &plugin, quint32 subId)
    {
        EffectRecord record;
        record.subId = subId;
        EXPECT_FALSE(plugin.load(record, VSTHostCallback, 0));
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
};

/// What an opcode is answered, by who asks.
struct AnswerRow {
    int opcode;
    VstIntPtr null;
    VstIntPtr ofNoPlugin;
    VstIntPtr ofPlugin;
    VstIntPtr ofIgnored;
    bool directWithEffect;
};

/// All others are answered 0.
const AnswerRow kAnswers[] = {
    {1, 2400, 2400, 2400, 2400, false},
    {2, 0, 0, 0, 0, true},
    {4, 1, 0, 0, 0, true},
    {6, 1, 1, 1, 1, false},
    {11, 8192, 8192, 8192, 8192, false},
    {14, 1, 1, 1, 1, false},
    {16, 44100, 44100, 44100, 44100, false},
    {17, 256, 256, 256, 256, false},
    {23, 1, 1, 1, 1, false},
    {32, 1, 1, 1, 1, false},
    {33, 1, 1, 1, 1, false},
    {34, 1, 1, 1, 1, false},
    {38, 1, 1, 1, 1, false},
    {42, 1, 1, 1, 1, false},
    {43, 0, 0, 1, 0, false},
    {44, 0, 0, 1, 0, false},
};

AnswerRow answersTo(int opcode)
{
    for (const AnswerRow &row : kAnswers)
        if (row.opcode == opcode)
            return row;
    return {opcode, 0, 0, 0, 0, false};
}

} // namespace

TEST_F(VSTHostCallbackTest, EveryOpcodeHasItsAnswer)
{
    std::vector<int> opcodes = {47, 48, 70, 128, 100003, INT_MAX, INT_MIN, -1};
    for (int opcode = 0; opcode <= 46; ++opcode)
        opcodes.push_back(opcode);
    debugLogSettings().trace = true;
    for (const int opcode : opcodes) {
        const AnswerRow row = answersTo(opcode);
        const struct {
            const char *name;
            AEffect *effect;
            VstIntPtr answer;
            bool direct;
        } askers[] = {{"null effect", nullptr, row.null, opcode == audioMasterCurrentId},
                      {"effect of no plug-in", &m_strange, row.ofNoPlugin, row.directWithEffect},
                      {"effect of a plug-in", &m_owned, row.ofPlugin, row.directWithEffect},
                      {"effect of the ignored one", &m_ignoredEffect, row.ofIgnored, row.directWithEffect}};
        for (const auto &asker : askers) {
            SCOPED_TRACE(asker.name + std::string(" asks ") + std::to_string(opcode));
            const QString returned = QStringLiteral("VST HostCallback returned %1").arg(asker.answer);
            std::array<char, 64> buffer = {};
            const int called = m_log.count(QStringLiteral("VST HostCallback(%1, 0, 0, 0x").arg(opcode));
            const int answered = m_log.count(returned);
            EXPECT_EQ(call(asker.effect, opcode, 0, 0, buffer.data()), asker.answer);
            EXPECT_EQ(m_log.count(QStringLiteral("VST HostCallback(%1, 0, 0, 0x").arg(opcode)), called + 1);
            if (opcode != VstPublished::audioMasterIdle) { // a plug-in's own calls come in between
                EXPECT_EQ(m_log.count(returned), answered + (asker.direct ? 0 : 1));
            }
        }
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
    EXPECT_EQ(m_log.lines(), QStringList({QStringLiteral("VST HostCallback(1, -7, 5, 0xab, 0.250000);"),
                                          QStringLiteral("VST HostCallback returned 2400")}));
}

TEST_F(VSTHostCallbackTest, PinsAreConnectedUpToTheEffectsCount)
{
    const struct {
        const char *name;
        VstInt32 index;
        VstIntPtr value;
        VstIntPtr answer;
    } cases[] = {{"first input", 0, 0, 0},
                 {"last input", 1, 0, 0},
                 {"input behind the last", 2, 0, 1},
                 {"last output", 2, 1, 0},
                 {"output behind the last", 3, 1, 1},
                 {"neither input nor output", 0, 2, 1},
                 {"negative kind", 0, -1, 1},
                 {"a kind beyond 32 bits", 0, VstIntPtr{1} << 32, 1}};
    debugLogSettings().trace = true;
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        const int before = m_log.count(QStringLiteral("returned"));
        EXPECT_EQ(call(&m_owned, VstPublished::audioMasterPinConnected, row.index, row.value), row.answer);
        EXPECT_EQ(m_log.count(QStringLiteral("returned")) - before, row.answer) << "a trace line or none";
        EXPECT_EQ(call(nullptr, VstPublished::audioMasterPinConnected, row.index, row.value), 1);
    }
}

TEST_F(VSTHostCallbackTest, CapabilitiesAreComparedExactly)
{
    const struct {
        const char *name;
        VstIntPtr answer;
    } cases[] = {{"sendVstEvents", 1},       {"sendVstMidiEvent", 1},
                 {"shellCategory", 1},       {"sendVstMidiEventFlagIsRealtime", 1},
                 {"sendVstTimeInfo", 1},     {"startStopProcess", 1},
                 {"openFileSelector", 1},    {"closeFileSelector", 1},
                 {"supplyIdle", 1},          {"sizeWindow", 1},
                 {"SendVstEvents", 0},       {"shellcategory", 0},
                 {"sendVstEvent", 0},        {"sendVstEvents ", 0},
                 {"receiveVstMidiEvent", 0}, {"", 0}};
    for (const auto &row : cases) {
        std::string text = row.name;
        EXPECT_EQ(call(nullptr, audioMasterCanDo, 0, 0, text.data()), row.answer) << row.name;
        EXPECT_EQ(call(&m_owned, audioMasterCanDo, 0, 0, text.data()), row.answer) << row.name;
    }
    EXPECT_EQ(call(nullptr, audioMasterCanDo, 0, 0, nullptr), 0);
}

TEST_F(VSTHostCallbackTest, TextsAreWrittenWithTheirZeroAndNothingMore)
{
    const struct {
        VstInt32 opcode;
        std::string written;
    } cases[] = {{audioMasterGetVendorString, std::string("Tessel") + '\0'},
                 {audioMasterGetProductString, std::string("Vantage II") + '\0'}};
    for (const auto &row : cases) {
        std::string buffer(64, '\x5A');
        EXPECT_EQ(call(nullptr, row.opcode, 0, 0, buffer.data()), 1);
        EXPECT_EQ(buffer, row.written + std::string(64 - row.written.size(), '\x5A'));
        EXPECT_EQ(call(nullptr, row.opcode, 0, 0, nullptr), 0) << "nowhere to write";
    }
}

TEST_F(VSTHostCallbackTest, SettingsAreTheHosts)
{
    m_host.setAudioSettings(-96000, 64);
    EXPECT_EQ(call(nullptr, audioMasterGetSampleRate), -96000);
    EXPECT_EQ(call(&m_owned, audioMasterGetBlockSize), 64);
}

TEST_F(VSTHostCallbackTest, RealtimeIsAPropertyOfTheCallingPlugin)
{
    m_plugin.setRealtime(true);
    EXPECT_EQ(call(&m_owned, audioMasterGetCurrentProcessLevel), 2);
    EXPECT_EQ(call(&m_ignoredEffect, audioMasterGetCurrentProcessLevel), 1);
    EXPECT_EQ(call(&m_strange, audioMasterGetCurrentProcessLevel), 1);
    EXPECT_EQ(call(nullptr, audioMasterGetCurrentProcessLevel), 1);
}

TEST_F(VSTHostCallbackTest, NotificationsReachTheCallingPluginOnly)
{
    const struct {
        const char *name;
        VstInt32 opcode;
        bool (VSTPlugin::*happened)() const;
    } cases[] = {{"wants MIDI", audioMasterWantMidi, &VSTPlugin::wantsMidi},
                 {"needs idle", VstPublished::audioMasterNeedIdle, &VSTPlugin::needsIdle},
                 {"channels changed", VstPublished::audioMasterIOChanged, &VSTPlugin::hasIoChanged}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        for (AEffect *effect : {static_cast<AEffect *>(nullptr), &m_strange})
            call(effect, row.opcode);
        EXPECT_FALSE((m_plugin.*row.happened)());
        call(&m_owned, row.opcode);
        EXPECT_TRUE((m_plugin.*row.happened)());
        EXPECT_FALSE((m_ignored.*row.happened)());
    }
    EXPECT_EQ(m_log.lines(), QStringList({QStringLiteral("Host Callback - audioMasterIOChanged"),
                                          QStringLiteral("Host Callback - audioMasterIOChanged")}))
        << "for an effect, with or without a plug-in, but not for none";
}

TEST_F(VSTHostCallbackTest, AnEffectOutlivingItsPluginIsAnEffectOfNoPlugin)
{
    AEffect effect = {};
    {
        VSTPlugin passing(m_host);
        effect = effectWith(&passing);
        EXPECT_EQ(call(&effect, audioMasterBeginEdit), 1);
    }
    EXPECT_EQ(call(&effect, audioMasterBeginEdit), 0);
    EXPECT_EQ(call(&effect, audioMasterCurrentId), 0);
}

TEST_F(VSTHostCallbackTest, CurrentIdIsThatOfThePluginBeingLoadedElseOfTheCallingOne)
{
    standFor(m_plugin, 0x80000001);
    VSTPlugin loading(m_host);
    standFor(loading, 11);
    const struct {
        const char *name;
        VSTPlugin *loading;
        AEffect *effect;
        VstIntPtr answer;
    } cases[] = {{"no effect", nullptr, nullptr, 0},
                 {"effect of no plug-in", nullptr, &m_strange, 0},
                 {"effect of a plug-in, sign-extended", nullptr, &m_owned, -0x7FFFFFFF},
                 {"no effect while one is loaded", &loading, nullptr, 11},
                 {"effect of another while one is loaded", &loading, &m_owned, 11},
                 {"while one without an identifier is loaded", &m_ignored, &m_owned, 0}};
    for (const auto &row : cases) {
        m_host.setPluginBeingLoaded(row.loading);
        EXPECT_EQ(call(row.effect, audioMasterCurrentId), row.answer) << row.name;
    }
}

TEST_F(VSTHostCallbackTest, TheEleventhNestedCallIsRefused)
{
    EXPECT_EQ(answerAtDepth(1), 2400);
    EXPECT_EQ(answerAtDepth(10), 2400);
    EXPECT_EQ(m_log.lines(), QStringList());
    EXPECT_EQ(answerAtDepth(11), 0);
    EXPECT_EQ(m_log.lines(),
              QStringList(QStringLiteral("VSTHost::HostCallback: Exceeded max Reentrancy: 11 of 10")));
    EXPECT_EQ(VSTCallbackNesting::active(), 0);
    EXPECT_EQ(answerAtDepth(10), 2400) << "a refusal leaves nothing behind";
}

TEST_F(VSTHostCallbackTest, ACounterThatRanAwayIsSetBack)
{
    const struct {
        const char *name;
        std::int32_t before;
        VstIntPtr answer;
        std::int32_t after;
    } cases[] = {{"tenth", 9, 2400, 9},           {"eleventh", 10, 0, 10},
                 {"last refused", 4094, 0, 4094}, {"first set back", 4095, 2400, -1},
                 {"far away", 1000000, 2400, -1}, {"below zero", -1, 2400, -1},
                 {"far below zero", -3, 0, -3}};
    for (const auto &row : cases) {
        VSTCallbackNesting::setActive(row.before);
        EXPECT_EQ(call(nullptr, audioMasterVersion), row.answer) << row.name;
        EXPECT_EQ(VSTCallbackNesting::active(), row.after) << row.name;
    }
}

TEST_F(VSTHostCallbackTest, EachThreadHasItsOwnCounter)
{
    VSTCallbackNesting::setActive(10);
    VstIntPtr answer = 0;
    std::thread([&answer] { answer = answerAtDepth(10); }).join();
    EXPECT_EQ(answer, 2400);
    EXPECT_EQ(call(nullptr, audioMasterVersion), 0);
}
