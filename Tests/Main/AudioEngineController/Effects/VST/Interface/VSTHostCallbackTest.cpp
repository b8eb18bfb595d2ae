#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostCallback.h"

#include "Main/AudioEngineController/Effects/VST/Interface/IVSTEffectOwner.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTCallbackNesting.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostContext.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

#include <array>
#include <climits>
#include <map>
#include <thread>

namespace {

VSTHostContext &context() { return VSTHostContext::instance(); }

/// What an idle call of the effect was answered by the host, which it asks inside of it.
thread_local VstIntPtr t_answerInIdle = -1;

VstIntPtr answerIdle(AEffect *effect, int opcode, int index, VstIntPtr value, void *ptr, float opt)
{
    EXPECT_EQ(opcode, VstPublished::effEditIdle);
    EXPECT_TRUE(index == 0 && value == 0 && ptr == nullptr && opt == 0.0f);
    t_answerInIdle = VSTHostCallback(effect, audioMasterVersion, 0, 0, nullptr, 0);
    return 5;
}

/// A registered owner with its effect, which notes what it hears.
struct Owner final : IVSTEffectOwner {
    explicit Owner(VstInt32 id)
        : shell(id)
    {
        effect.dispatcher = answerIdle;
        effect.numInputs = 2;
        effect.numOutputs = 3;
        effect.resvd1 = reinterpret_cast<VstIntPtr>(static_cast<IVSTEffectOwner *>(this));
        context().registerOwner(this);
    }
    ~Owner() { context().unregisterOwner(this); }

    void note(const char *what, double first = -1, double second = -1)
    {
        heard << what;
        for (const double value : {first, second})
            heard.back() += value < 0 ? QString() : QStringLiteral(" %1").arg(value);
    }
    QString name() const override { return "Comp"; }
    VstInt32 shellId() const override { return shell; }
    bool isRealtime() const override { return realtime; }
    void setNeedsIdle() override { note("idle"); }
    void setWantsMidi() override { note("midi"); }
    void ioChanged() override { note("channels"); }
    bool resizeEditor(VstInt32 width, VstInt32 height) override { return note("size", width, height), true; }
    void parameterChanged(VstInt32 index, float value) override { note("parameter", index, double(value)); }
    void parameterEdit(VstInt32 index, bool begins) override { note("edit", index, begins); }
    void refreshDisplay() override { note("display"); }

    VstInt32 shell;
    bool realtime = false;
    AEffect effect = {};
    QStringList heard;
};

class VSTHostCallbackTest : public testing::Test {
protected:
    VSTHostCallbackTest()
    {
        m_strange.dispatcher = answerIdle;
        m_strange.resvd1 = reinterpret_cast<VstIntPtr>(&m_log);
        context().setAudioSettings(44100, 256);
        context().setIgnored(&m_ignored);
    }
    ~VSTHostCallbackTest() override { VSTCallbackNesting::setActive(0); }

    static VstIntPtr call(AEffect *effect, VstInt32 opcode, VstInt32 index = 0, VstIntPtr value = 0,
                          void *ptr = nullptr)
    {
        return VSTHostCallback(effect, opcode, index, value, ptr, 0.5f);
    }

    const CapturedLog m_log;
    Owner m_owner{-0x7FFFFFFF}, m_ignored{0};
    AEffect m_strange = {};
    AEffect *const m_askers[4] = {&m_owner.effect, &m_ignored.effect, &m_strange, nullptr};
};

} // namespace

TEST_F(VSTHostCallbackTest, EveryOpcodeHasItsAnswer)
{
    // All but those that concern one plug-in; the others are answered 0.
    const std::map<int, VstIntPtr> answers = {{1, 2400}, {6, 1},  {11, 8192}, {14, 1}, {16, 44100}, {17, 256},
                                              {23, 1},   {32, 1}, {33, 1},    {34, 1}, {38, 1},     {42, 1}};
    std::vector<int> opcodes = {47, 48, 70, 128, 100003, INT_MAX, INT_MIN, -1};
    for (int opcode = 0; opcode <= 46; ++opcode)
        if (opcode != 2 && opcode != 4 && opcode != 15 && opcode != 43 && opcode != 44)
            opcodes.push_back(opcode);
    for (const int opcode : opcodes)
        for (AEffect *effect : m_askers) {
            std::array<char, 64> buffer = {};
            EXPECT_EQ(call(effect, opcode, -7, VstIntPtr{0x100000005}, buffer.data()),
                      answers.count(opcode) ? answers.at(opcode) : 0)
                << opcode;
        }
    EXPECT_EQ(VSTCallbackNesting::active(), 0);
    debugLogSettings().trace = true;
    call(nullptr, audioMasterVersion, -7, VstIntPtr{0x100000005});
    EXPECT_TRUE(m_log.contains("VST HostCallback(1, -7, 5, ") && m_log.contains("returned 2400"));
}

TEST_F(VSTHostCallbackTest, ReportsReachTheirRegisteredOwnerOnly)
{
    const struct {
        VstInt32 opcode;
        const char *heard;
        bool evenIgnored;
        VstIntPtr answer, unheardAnswer;
    } rows[] = {{0, "parameter 3 0.5", false, 0, 0}, {6, "midi", true, 1, 1},
                {13, "channels", true, 0, 0},        {14, "idle", true, 1, 1},
                {15, "size 3 7", true, 1, 0},        {42, "display", false, 1, 1},
                {43, "edit 3 1", false, 1, 0},       {44, "edit 3 0", false, 1, 0}};
    for (const auto &row : rows) {
        SCOPED_TRACE(row.heard);
        auto passing = std::make_unique<Owner>(0);
        AEffect left = passing->effect;
        passing.reset();
        for (AEffect *effect : {&m_strange, static_cast<AEffect *>(nullptr), &left})
            EXPECT_EQ(call(effect, row.opcode, 3, 7), row.unheardAnswer);
        EXPECT_EQ(m_owner.heard + m_ignored.heard, QStringList());
        EXPECT_EQ(call(&m_owner.effect, row.opcode, 3, 7), row.answer);
        EXPECT_EQ(call(&m_ignored.effect, row.opcode, 3, 7),
                  row.evenIgnored ? row.answer : row.unheardAnswer);
        EXPECT_EQ(m_owner.heard, QStringList(row.heard));
        EXPECT_EQ(m_ignored.heard, row.evenIgnored ? QStringList(row.heard) : QStringList());
        m_owner.heard.clear();
        m_ignored.heard.clear();
    }
}

TEST_F(VSTHostCallbackTest, PinsAreConnectedUpToTheEffectsCount)
{
    const std::tuple<VstInt32, VstIntPtr, VstIntPtr> rows[] = {
        {1, 0, 0}, {2, 0, 1}, {2, 1, 0}, {3, 1, 1}, {0, 2, 1}, {0, VstIntPtr{1} << 32, 1}};
    for (const auto &[index, kind, expected] : rows) {
        EXPECT_EQ(call(&m_owner.effect, 4, index, kind), expected) << index << " of kind " << kind;
        EXPECT_EQ(call(nullptr, 4, index, kind), 1);
    }
}

TEST_F(VSTHostCallbackTest, TextsAreComparedAndWrittenExactly)
{
    const auto answerTo = [](const char *capability) {
        return call(nullptr, audioMasterCanDo, 0, 0, const_cast<char *>(capability));
    };
    for (const char *known : {"sendVstEvents", "sendVstMidiEvent", "shellCategory",
                              "sendVstMidiEventFlagIsRealtime", "sendVstTimeInfo", "startStopProcess",
                              "openFileSelector", "closeFileSelector", "supplyIdle", "sizeWindow"})
        EXPECT_EQ(answerTo(known), 1) << known;
    for (const char *unknown : {"SendVstEvents", "sendVstEvents ", "receiveVstMidiEvent", ""})
        EXPECT_EQ(answerTo(unknown), 0) << unknown;
    for (const auto &[opcode, text] : {std::pair(audioMasterGetVendorString, std::string("Tessel")),
                                       {audioMasterGetProductString, "Vantage II"}}) {
        std::string buffer(64, '\x5A');
        EXPECT_EQ(call(nullptr, opcode, 0, 0, buffer.data()), 1);
        EXPECT_EQ(buffer, text + '\0' + std::string(63 - text.size(), '\x5A'));
    }
    for (const int opcode : {audioMasterCanDo, audioMasterGetVendorString, audioMasterGetProductString})
        EXPECT_EQ(call(nullptr, opcode), 0) << "null";
}

TEST_F(VSTHostCallbackTest, SettingsAndOwnersAreAskedAtEachCall)
{
    context().setAudioSettings(-96000, 64);
    EXPECT_EQ(call(nullptr, audioMasterGetSampleRate), -96000);
    EXPECT_EQ(call(&m_owner.effect, audioMasterGetBlockSize), 64);
    m_owner.realtime = true;
    for (AEffect *effect : m_askers)
        EXPECT_EQ(call(effect, audioMasterGetCurrentProcessLevel), effect == &m_owner.effect ? 2 : 1);
    for (AEffect *effect : m_askers) // sign-extended
        EXPECT_EQ(call(effect, audioMasterCurrentId), effect == &m_owner.effect ? -0x7FFFFFFF : 0);
    for (Owner *loading : {&m_owner, &m_ignored}) {
        context().setOwnerBeingLoaded(loading);
        for (AEffect *effect : m_askers)
            EXPECT_EQ(call(effect, audioMasterCurrentId), loading->shell);
    }
    context().setOwnerBeingLoaded(nullptr);
}

TEST_F(VSTHostCallbackTest, TheEleventhNestedCallOfAThreadIsRefused)
{
    const struct {
        std::int32_t before; ///< active calls
        VstIntPtr answer;
        std::int32_t after;
    } rows[] = {{9, 2400, 9}, {10, 0, 10}, {4094, 0, 4094}, {4095, 2400, -1}, {-1, 2400, -1}, {-3, 0, -3}};
    for (const auto &row : rows) {
        VSTCallbackNesting::setActive(row.before);
        EXPECT_EQ(call(nullptr, audioMasterVersion), row.answer) << row.before;
        EXPECT_EQ(VSTCallbackNesting::active(), row.after) << row.before;
    }
    for (const int before : {8, 9}) {
        VSTCallbackNesting::setActive(before);
        EXPECT_EQ(call(&m_owner.effect, VstPublished::audioMasterIdle), 0);
        EXPECT_EQ(t_answerInIdle, before == 8 ? 2400 : 0);
    }
    std::thread([] { EXPECT_EQ(call(nullptr, audioMasterVersion), 2400); }).join();
}
