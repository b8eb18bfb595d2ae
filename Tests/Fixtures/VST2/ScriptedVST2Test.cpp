#include "Core/BaseLib/PluginLibrary.h"
#include "Core/BaseLib/ThreadCount.h"
#include "Main/AudioEngineController/Effects/VST/VSTInterface.h"
#include "Tests/Fixtures/FixtureMisuse.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST2Fixture.h"

#include <gtest/gtest.h>

#include <array>
#include <atomic>
#include <csignal>
#include <cstring>
#include <thread>

#include <unistd.h>

namespace {

/// What the smallest host tells plug-ins.
struct Bench {
    std::atomic<std::int32_t> currentId = 0;
    std::atomic<int> versionCalls = 0;
    std::atomic<bool> calledFromAnotherThread = false;
    std::thread::id thread = std::this_thread::get_id();
} bench;

thread_local int activeCalls = 0;

VstIntPtr answer(AEffect *effect, int opcode, void *pointer)
{
    switch (opcode) {
    case audioMasterVersion:
        ++bench.versionCalls;
        return activeCalls > 10 ? 0 : 2400;
    case audioMasterCurrentId:
        return bench.currentId;
    case VstPublished::audioMasterIdle:
        return activeCalls > 10 ? 0 : effect->dispatcher(effect, VstPublished::effEditIdle, 0, 0, nullptr, 0);
    case audioMasterGetVendorString:
        std::memcpy(pointer, "Bench", sizeof "Bench");
        return 1;
    case audioMasterCanDo:
        return std::strcmp(static_cast<const char *>(pointer), "shellCategory") == 0;
    default:
        return 0;
    }
}

VstIntPtr callHost(AEffect *effect, int opcode, int, VstIntPtr, void *const pointer, float)
{
    if (std::this_thread::get_id() != bench.thread)
        bench.calledFromAnotherThread = true;
    ++activeCalls;
    const VstIntPtr result = answer(effect, opcode, pointer);
    --activeCalls;
    return result;
}

VstIntPtr dispatch(AEffect *effect, int opcode, void *pointer = nullptr, int index = 0, VstIntPtr value = 0)
{
    return effect->dispatcher(effect, opcode, index, value, pointer, 0);
}

/// The text that an opcode writes, in front of it what it answers.
QByteArray ask(AEffect *effect, int opcode, int index = 0)
{
    std::array<char, 1025> buffer = {};
    const VstIntPtr result = dispatch(effect, opcode, buffer.data(), index);
    return QByteArray::number(static_cast<qlonglong>(result)) + ' ' + QByteArray(buffer.data());
}

QByteArray describe(AEffect *effect)
{
    if (!effect)
        return "null";
    QByteArray text = ask(effect, effGetEffectName);
    text += '|' + ask(effect, effGetVendorString);
    for (const VstIntPtr number :
         {dispatch(effect, effGetPlugCategory), VstIntPtr{effect->uniqueID}, VstIntPtr{effect->numInputs},
          VstIntPtr{effect->numOutputs}, VstIntPtr{effect->initialDelay}, VstIntPtr{effect->numParams},
          VstIntPtr{static_cast<std::int32_t>(effect->flags)}})
        text += '|' + QByteArray::number(static_cast<qlonglong>(number));
    return text + (effect->magic == kEffectMagic ? "" : "|wrong magic");
}

class ScriptedVST2 : public testing::Test {
protected:
    void load(const QByteArray &script, VST2Fixture fixture = VST2Fixture::Scripted)
    {
        m_library.free();
        const QString path = addVST2File(m_folder.plugins(), QStringLiteral("Comp"), script, fixture);
        ASSERT_TRUE(m_library.load(path)) << qPrintable(m_library.errorText());
    }
    AEffect *enter(std::int32_t id = 0, const char *entryPoint = "VSTPluginMain")
    {
        bench.currentId = id;
        return reinterpret_cast<AEffect *(*)(audioMasterCallback)>(m_library.symbol(entryPoint))(callHost);
    }
    AEffect *enterNew(const QByteArray &script)
    {
        load(script);
        return enter();
    }
    QByteArray traceStatement() const
    {
        return "trace \"" + m_folder.path(QStringLiteral("trace")).toUtf8() + "\"\n";
    }
    QStringList trace(const char *part = "") const
    {
        return m_folder.lines(QStringLiteral("trace")).filter(QLatin1String(part));
    }

    TestFolder m_folder;
    PluginLibrary m_library;
};

const char kShell[] = "name Shell\nchild 11 \"Child A\"\nchild -2 \"Child B\"\nname Own\nid 7\nvendor V\n"
                      "category 2\ninputs 0\noutputs 6\n";

} // namespace

TEST_F(ScriptedVST2, SaysWhatItsScriptSays)
{
    const QByteArray fullName(1024, 'n');
    const QByteArray fullVendor(256, 'v');
    const struct {
        const char *name;
        QByteArray script;
        QByteArray effect;
    } cases[] = {
        {"no script", {}, "1 Comp|1 Fixture Works|1|1000|2|2|0|0|16"},
        {"numbers at their limits",
         "id -2147483648\ninputs -1\noutputs 2147483647\nlatency -5\ncategory 77\nflags 0x80000001\n"
         "stated-parameters 9\n",
         "1 Comp|1 Fixture Works|77|-2147483648|-1|2147483647|-5|9|-2147483647"},
        {"texts that fill the host's buffers", "name " + fullName + "\nvendor " + fullVendor + "\n",
         "1 " + fullName + "|1 " + fullVendor + "|1|1000|2|2|0|0|16"},
        {"invalid UTF-8 and answers that do not fit",
         "name \\xFF\\xC3 unterminated\nvendor \"\"\nanswer get-effect-name 0\nanswer get-vendor-string 1\n"
         "answer get-plug-category -3\n",
         "0 \xFF\xC3|1 |-3|1000|2|2|0|0|16"},
        {"wrong magic", "magic 0x11223344\n", "1 Comp|1 Fixture Works|1|1000|2|2|0|0|16|wrong magic"},
        {"null effect", "answer entry null\n", "null"}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        EXPECT_EQ(describe(enterNew(row.script)), row.effect);
    }
    EXPECT_EQ(enterNew("answer entry no-memory\n"), reinterpret_cast<AEffect *>(16));
}

TEST_F(ScriptedVST2, EntryPointsAreToldApart)
{
    load({}, VST2Fixture::Main);
    EXPECT_EQ(m_library.symbol("VSTPluginMain"), nullptr);
    EXPECT_TRUE(describe(enter(0, "main")).startsWith("1 Comp|1 Fixture Works|1|1000|"));
    load({}, VST2Fixture::Both);
    EXPECT_TRUE(describe(enter()).startsWith("1 Comp|1 Fixture Works|1|1000|"));
    EXPECT_TRUE(describe(enter(0, "main")).startsWith("1 Comp by main|1 Fixture Works|1|1001|"));
    load({}, VST2Fixture::NoEntry);
    EXPECT_EQ(m_library.symbol("VSTPluginMain"), nullptr);
    EXPECT_EQ(m_library.symbol("main"), nullptr);
}

TEST_F(ScriptedVST2, ShellsListAndServeTheirChildren)
{
    AEffect *shell =
        enterNew(traceStatement() + kShell + "answer entry null 11\ndelay entry 1 \"Child B\"\n");
    EXPECT_EQ(describe(shell), "1 Shell|1 Fixture Works|10|1000|2|2|0|0|16");
    for (const char *listed : {"11 Child A", "-2 Child B", "0 ", "11 Child A"})
        EXPECT_EQ(ask(shell, effShellGetNextPlugin), listed);
    EXPECT_EQ(describe(enter(11)), "null");
    EXPECT_EQ(describe(enter(-2)), "1 Own|1 V|2|7|0|6|0|0|16");
    EXPECT_EQ(describe(enter(99)), "null");
    EXPECT_EQ(trace("unknown"), QStringList(QStringLiteral("entry: 99 unknown")));
}

TEST_F(ScriptedVST2, ShellsGoOnAfterTheirLastChild)
{
    AEffect *repeating = enterNew("child 1 A\nchild 1 B\nafter-children repeat\n");
    for (const char *listed : {"1 A", "1 B", "1 A", "1 B"})
        EXPECT_EQ(ask(repeating, effShellGetNextPlugin), listed);
    AEffect *endless = enterNew("child 1 A\nafter-children endless\n");
    for (const char *listed : {"1 A", "1000001 Endless 1000001", "1000002 Endless 1000002"})
        EXPECT_EQ(ask(endless, effShellGetNextPlugin), listed);
    EXPECT_TRUE(describe(enter(1000002)).startsWith("1 Endless 1000002|"));
}

TEST_F(ScriptedVST2, PresetsAndParameters)
{
    AEffect *effect = enterNew(traceStatement() + "parameter \" \" -0.5\nparameter Gain 1e3 Gain_Long\n"
                                                  "chunk a\\x00b\n");
    EXPECT_EQ(describe(effect).right(5), "|2|48");
    EXPECT_EQ(ask(effect, effGetParamName, 1), "0 Gain");
    EXPECT_EQ(ask(effect, effGetParamName, 2), "0 ");
    EXPECT_EQ(effect->getParameter(effect, 0), -0.5f);
    effect->setParameter(effect, 0, 0.25f);
    EXPECT_EQ(effect->getParameter(effect, 0), 0.25f);

    VstPublished::VstParameterProperties properties = {};
    const int opcode = VstPublished::effGetParameterProperties;
    EXPECT_EQ(dispatch(effect, opcode, &properties, 0), 0);
    EXPECT_EQ(dispatch(effect, opcode, &properties, 1), 1);
    EXPECT_EQ(QByteArray(properties.shortLabel, 8), "Gain_Lon");

    const char *data = nullptr;
    EXPECT_EQ(dispatch(effect, effGetChunk, &data, 1), 3);
    EXPECT_EQ(QByteArray(data, 3), QByteArray("a\0b", 3));
    char handed[] = "xy";
    dispatch(effect, effSetChunk, handed, 1, 2);
    EXPECT_EQ(dispatch(effect, effGetChunk, &data, 1), 2);
    EXPECT_EQ(trace("set-"), QStringList({QStringLiteral("set-parameter Comp: 0 0.25"),
                                          QStringLiteral("set-chunk Comp: 1 2 xy")}));

    AEffect *lying = enterNew("chunk a\nnull-chunk\nanswer get-chunk 1000000\n");
    EXPECT_EQ(dispatch(lying, effGetChunk, &data, 1), 1000000);
    EXPECT_EQ(data, nullptr);
}

TEST_F(ScriptedVST2, SpeakerArrangementsAreTracedAndAnswered)
{
    AEffect *effect = enterNew(traceStatement() + "answer set-speaker-arrangement 0\n");
    VstSpeakerArrangement empty = {};
    empty.type = -2;
    const auto value = reinterpret_cast<VstIntPtr>(&empty);
    EXPECT_EQ(dispatch(effect, effSetSpeakerArrangement, nullptr, 0, value), 0);
    EXPECT_EQ(trace("speaker"), QStringList(QStringLiteral("set-speaker-arrangement Comp: -2() -> null")));
    EXPECT_EQ(dispatch(enterNew({}), effSetSpeakerArrangement, nullptr, 0, value), 1);
}

TEST_F(ScriptedVST2, HostCallsAreAnsweredInTheTrace)
{
    AEffect *effect = enterNew(traceStatement() +
                               "ask-host entry 32 buffer null-effect\nask-host open 37 text shellCategory\n"
                               "ask-host open 37 text ShellCategory\nask-host open 1 nested 10\n"
                               "ask-host open 1 nested 11\nask-host open 1 nested 12\n"
                               "ask-host open 1 for Other\nask-host static-destructor 1\n");
    dispatch(effect, effOpen);
    dispatch(effect, effClose);
    m_library.free();
    EXPECT_EQ(trace("host-"),
              QStringList({QStringLiteral("host-32 Comp: 1 \"Bench\" in 6 bytes"),
                           QStringLiteral("host-37 Comp: 1"), QStringLiteral("host-37 Comp: 0"),
                           QStringLiteral("host-1 Comp: 2400"), QStringLiteral("host-1 Comp: 0"),
                           QStringLiteral("host-1 Comp: not reached"), QStringLiteral("host-1: 2400")}));
    EXPECT_EQ(trace("edit-idle").size(), 9 + 10 + 10);
}

TEST_F(ScriptedVST2, OtherThreadsCallTheHost)
{
    bench.calledFromAnotherThread = false;
    enterNew("ask-host entry 16 from-thread\n");
    EXPECT_TRUE(bench.calledFromAnotherThread);
    for (const char *until : {"until-close", "until-unload"}) {
        SCOPED_TRACE(until);
        AEffect *effect = enterNew(QByteArray("ask-host open 1 ") + until + '\n');
        bench.versionCalls = 0;
        dispatch(effect, effOpen);
        while (bench.versionCalls < 3)
            std::this_thread::yield();
        dispatch(effect, effClose);
        m_library.free(); // joins, or the next call comes from unmapped code
    }
}

TEST_F(ScriptedVST2, TraceHoldsEveryCallInItsOrder)
{
    AEffect *shell = enterNew(traceStatement() + kShell);
    describe(shell);
    for (int count = 0; count < 3; ++count)
        ask(shell, effShellGetNextPlugin);
    AEffect *child = enter(11);
    dispatch(child, effMainsChanged, nullptr, 0, 1);
    dispatch(child, effSetBlockSize, nullptr, 0, 64);
    dispatch(child, effClose);
    m_library.free();
    EXPECT_EQ(trace().join('\n'),
              QStringLiteral("static-constructor\nentry Shell\nget-effect-name Shell\n"
                             "get-vendor-string Shell\nget-plug-category Shell\nshell-next Child A\n"
                             "shell-next Child B\nshell-next Shell: end\nentry Child A: 11\n"
                             "mains-changed Child A: 0 1\nopcode-11 Child A: 0 64\nclose Child A\n"
                             "static-destructor: 1 open"));
}

TEST_F(ScriptedVST2, FaultsHappenAtEveryStage)
{
    const auto live = [this](const QByteArray &stage) {
        AEffect *shell = enterNew(traceStatement() + kShell + "fault " + stage + '\n');
        ask(shell, effShellGetNextPlugin);
        ask(shell, effShellGetNextPlugin);
        AEffect *child = enter(-2);
        describe(child);
        dispatch(child, effOpen);
        dispatch(child, effMainsChanged);
        dispatch(child, 99);
        dispatch(child, effClose);
        m_library.free();
        std::_Exit(0);
    };
    for (const char *stage :
         {"static-constructor kill", "entry kill -2", "shell-next kill -2",
          "get-plug-category kill \"Child B\"", "get-effect-name kill 0xFFFFFFFE", "get-vendor-string kill",
          "open kill", "mains-changed kill", "opcode-99 kill", "close kill", "static-destructor kill"}) {
        SCOPED_TRACE(stage);
        m_folder.write(QStringLiteral("trace"), {});
        EXPECT_EXIT(live(stage), testing::KilledBySignal(SIGKILL), "");
        ASSERT_FALSE(trace().isEmpty());
        EXPECT_TRUE(trace().last().startsWith(QString::fromLatin1(stage).section(QLatin1Char(' '), 0, 0)));
    }
    EXPECT_EXIT(live("get-effect-name kill 11"), testing::ExitedWithCode(0), "");
    AEffect *throwing = enterNew("fault get-effect-name throw-std\n");
    EXPECT_THROW(ask(throwing, effGetEffectName), std::runtime_error);
}

TEST_F(ScriptedVST2, OwnViolationsAreRepaired)
{
    const auto repair = [this](const QByteArray &afterwards) {
        std::signal(SIGSEGV, [](int) { std::_Exit(7); });
        AEffect *effect = enterNew("effect open repair " + afterwards + "\nfault mains-changed segv\n");
        dispatch(effect, effOpen);
        dispatch(effect, effMainsChanged);
    };
    EXPECT_EXIT(repair("restore"), testing::ExitedWithCode(7), "");
    EXPECT_EXIT(repair("keep"), testing::KilledBySignal(SIGSEGV), "");
}

TEST_F(ScriptedVST2, ThreadsOfEffectsThatWereNotClosedDieWithTheModule)
{
    const std::set<int> threads = runningThreads();
    dispatch(enterNew("own-thread\n"), effClose);
    EXPECT_TRUE(newThreadsEnd(threads, std::chrono::seconds(30)));
    const auto unload = [this] {
        std::signal(SIGSEGV, SIG_DFL);
        enterNew("own-thread\n");
        m_library.free();
        for (alarm(30);;)
            pause();
    };
    EXPECT_EXIT(unload(), testing::KilledBySignal(SIGSEGV), "");
}

TEST_F(ScriptedVST2, WrongScriptsAndWrongUseEndTheProcess)
{
    const auto misused = testing::ExitedWithCode(kFixtureMisused);
    const QByteArray longText(1025, 'n');
    for (const QByteArray &script :
         {QByteArray("nam A"), "name " + longText, "vendor " + longText.left(257), QByteArray("inputs two"),
          QByteArray("fault opcode-35 segv"), QByteArray("after-children never"),
          QByteArray("parameter A 1.5x"), QByteArray("ask-host static-constructor 1"),
          QByteArray("ask-host open 1 loudly"), QByteArray("ask-host open 1 nested 2 null-effect"),
          QByteArray("ask-host static-destructor 1 until-unload")}) {
        SCOPED_TRACE(script.constData());
        EXPECT_EXIT(enterNew(script), misused, "fixture misused");
    }
    EXPECT_EXIT(enterNew("answer entry 5\n"), misused, "cannot answer");
    AEffect *effect = enterNew({});
    EXPECT_EXIT(dispatch(effect, effGetEffectName), misused, "without a pointer");
    dispatch(effect, effClose);
    EXPECT_NE(effect->magic, kEffectMagic);
    EXPECT_EXIT(dispatch(effect, effClose), misused, "after it was closed");
}
