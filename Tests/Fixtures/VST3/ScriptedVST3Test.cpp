#include "Core/BaseLib/PluginLibrary.h"
#include "Tests/Fixtures/FixtureMisuse.h"
#include "Tests/Support/ScannerRun.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST3Fixture.h"

#include <gtest/gtest-spi.h>
#include <gtest/gtest.h>

#include <pluginterfaces/base/ipluginbase.h>
#include <pluginterfaces/vst/ivstcomponent.h>

#include <cfenv>
#include <csignal>

using namespace Steinberg;

namespace {

const QString kHost = QStringLiteral(FXPROBE_FIXTURE_HOST);

/// A module for tests in a folder of its own, and the small host that lists it.
class ScriptedVST3 : public testing::Test {
protected:
    ScannerOutcome list(const QString &module)
    {
        ScannerRun run(kHost, m_folder);
        run.setArguments({module});
        return run.run();
    }
    ScannerOutcome listScript(const QByteArray &script, VST3Fixture fixture = VST3Fixture::Scripted)
    {
        return list(addVST3File(m_folder.plugins(), QStringLiteral("Comp"), script, fixture));
    }
    QByteArray traceStatement() const
    {
        return "trace \"" + m_folder.path(QStringLiteral("trace")).toUtf8() + "\"\n";
    }
    QStringList trace() const { return m_folder.lines(QStringLiteral("trace")); }

    TestFolder m_folder;
};

const char kFullClass[] = "class \"Comp\"\nid 00112233445566778899AABBCCDDEEFF\n";

} // namespace

TEST_F(ScriptedVST3, WithoutScriptThereIsOneHealthyClassNamedAfterTheFile)
{
    const QString plain = addVST3File(m_folder.plugins(), QStringLiteral("Plain x64"));
    const QString bundle = addVST3Bundle(m_folder.plugins(), QStringLiteral("Bündel"));
    for (const auto &[path, name] :
         {std::pair(plain, "|Plain x64|"), std::pair(vst3BundleBinary(bundle), "|Bündel|")}) {
        const ScannerOutcome outcome = list(path);
        EXPECT_TRUE(outcome.succeeded()) << outcome.standardError.constData();
        EXPECT_TRUE(
            outcome.standardOutput.startsWith("factory: Fixture Works|||1\nclass: Audio Module Class|"))
            << outcome.standardOutput.constData();
        EXPECT_TRUE(outcome.standardOutput.contains(name)) << outcome.standardOutput.constData();
        EXPECT_TRUE(outcome.standardOutput.endsWith("|Fx|: in [1] 2:0, out [1] 2:0\nunloaded\n"))
            << outcome.standardOutput.constData();
    }
}

TEST_F(ScriptedVST3, SaysWhatItsScriptSays)
{
    const QByteArray longName(80, 'n');
    const struct {
        const char *name;
        QByteArray script;
        QByteArray output; // without the last line
    } cases[] = {
        {"factory texts", "factory-vendor \"A & B\"\nfactory-url u\nfactory-email e\n",
         "factory: A & B|u|e|0\n"},
        {"class texts and buses",
         kFullClass +
             QByteArray("category Other\nsubcategories Fx|EQ\nvendor V\ninputs 2 6:aux 1:7\noutputs\n"),
         "factory: Fixture Works|||1\nclass: Other|Comp|00112233445566778899AABBCCDDEEFF|Fx|EQ|V: in [3] 2:0 "
         "6:1 1:7, "
         "out [0]\n"},
        {"invalid UTF-8, and a name that fills its field",
         "class \"" + longName +
             "\\xFF\"\nvendor \\xFF\\xC3\nid "
             "00112233445566778899AABBCCDDEEFF\nanswer create-instance false\n",
         "factory: Fixture Works|||1\nclass: Audio Module Class|" + longName.left(64) +
             "|00112233445566778899AABBCCDDEEFF|Fx|\xFF\xC3: no instance\n"},
        {"old factory", QByteArray("generation 1\n") + kFullClass,
         "factory: Fixture Works|||1\nclass: Audio Module Class|Comp|00112233445566778899AABBCCDDEEFF|-: in "
         "[1] 2:0, out "
         "[1] 2:0\n"},
        {"factory without its interface", "generation 0\n", "no IPluginFactory\n"},
        {"null factory", "answer get-factory null\n", "null factory\n"},
        {"negative class count", QByteArray("answer count-classes -5\n") + kFullClass,
         "factory: Fixture Works|||-5\n"},
        {"class count too large", "answer count-classes 2\n",
         "factory: Fixture Works|||2\nclass: no information\nclass: no information\n"},
        {"hostile bus counts and channels",
         kFullClass + QByteArray("stated-inputs -3\noutputs -2147483648\nstated-outputs 2\n"),
         "factory: Fixture Works|||1\nclass: Audio Module Class|Comp|00112233445566778899AABBCCDDEEFF|Fx|: "
         "in [-3], out [2] "
         "-2147483648:0 none\n"},
        {"failing steps of single classes",
         "class A\nid 0000000000000000000000000000000A\nclass B\nid 0000000000000000000000000000000B\nclass "
         "C\n"
         "answer create-instance null A\nanswer initialize internal-error B\nanswer class-info false C\n",
         "factory: Fixture Works|||3\nclass: Audio Module Class|A|0000000000000000000000000000000A|Fx|: null "
         "instance\n"
         "class: Audio Module Class|B|0000000000000000000000000000000B|Fx|: not initialised\n"
         "class: no information\n"},
        {"entry and exit refuse", "answer module-entry false\nanswer module-exit false\n",
         "entry refused\nexit refused\n"}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        const ScannerOutcome outcome = listScript(row.script);
        EXPECT_TRUE(outcome.succeeded()) << outcome.standardError.constData();
        EXPECT_EQ(outcome.standardOutput, row.output + "unloaded\n");
    }
}

TEST_F(ScriptedVST3, TraceHoldsEveryCallInItsOrder)
{
    listScript(traceStatement() + "class \"Two Words\"\ninputs 1 1\nclass B\nanswer initialize false B\n");
    EXPECT_EQ(trace().join('\n'),
              QStringLiteral("static-constructor\nmodule-entry\nget-factory\nfactory-info\n"
                             "count-classes\nclass-info Two Words\nclass-info2 Two Words\n"
                             "create-instance Two Words\ninitialize Two Words\n"
                             "bus-count Two Words: input\nbus-info Two Words: input 0\n"
                             "bus-info Two Words: input 1\nbus-count Two Words: output\n"
                             "bus-info Two Words: output 0\nterminate Two Words\n"
                             "release Two Words\nclass-info B\nclass-info2 B\n"
                             "create-instance B\ninitialize B\nfactory-release\nmodule-exit\n"
                             "static-destructor"));
}

TEST_F(ScriptedVST3, ModulesWithoutEntryFunctions)
{
    const ScannerOutcome plain = listScript(traceStatement(), VST3Fixture::Plain);
    EXPECT_EQ(plain.standardOutput, "factory: Fixture Works|||0\nunloaded\n");
    EXPECT_EQ(trace().filter(QStringLiteral("module-")), QStringList());
    EXPECT_EQ(listScript({}, VST3Fixture::NoEntry).standardOutput, "no GetPluginFactory\nunloaded\n");
}

TEST_F(ScriptedVST3, QuestionsToTheHostAreAnsweredInTheTrace)
{
    listScript(traceStatement() + "class A\nask-host name message attributes unknown\n");
    EXPECT_EQ(trace().filter(QStringLiteral("host-")),
              QStringList({QStringLiteral("host-name A: ok Bench"),
                           QStringLiteral("host-message A: false no message"),
                           QStringLiteral("host-attributes A: not-implemented no list"),
                           QStringLiteral("host-unknown A: not-implemented null")}));
}

TEST_F(ScriptedVST3, EveryKindOfFaultEndsAsNamed)
{
    const struct {
        const char *kind;
        int signal;         // 0: the process exits with 0
        const char *output; // after the fault
    } cases[] = {{"segv", SIGSEGV, ""},
                 {"abort", SIGABRT, ""},
                 {"exit", 0, ""},
                 {"_exit", 0, ""},
                 {"divide", SIGFPE, ""},
                 {"illegal", SIGILL, ""},
                 {"stack-overflow", SIGSEGV, ""},
                 {"throw-std", 0, "caught thrown by the fixture\nunloaded\n"},
                 {"throw-int", 0, "caught 42\nunloaded\n"},
                 {"terminate", SIGABRT, ""},
                 {"kill", SIGKILL, ""},
                 {"pthread-exit", 0, ""}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.kind);
        const ScannerOutcome outcome = listScript(QByteArray("class A\nfault create-instance ") + row.kind);
        EXPECT_EQ(outcome.signal, row.signal);
        EXPECT_EQ(outcome.crashed, row.signal != 0);
        EXPECT_EQ(outcome.exitCode, row.signal ? -1 : 0);
        EXPECT_EQ(outcome.standardOutput, QByteArray("factory: Fixture Works|||1\n") + row.output);
    }
}

TEST_F(ScriptedVST3, FaultsHappenAtEveryStage)
{
    for (const char *stage :
         {"static-constructor", "module-entry", "get-factory", "factory-info", "count-classes", "class-info",
          "class-info2", "create-instance", "initialize", "bus-count", "bus-info", "terminate", "release",
          "factory-release", "module-exit", "static-destructor"}) {
        SCOPED_TRACE(stage);
        m_folder.write(QStringLiteral("trace"), {});
        const ScannerOutcome outcome = listScript(traceStatement() + "class A\nfault " + stage + " kill\n");
        EXPECT_EQ(outcome.signal, SIGKILL);
        // Also the last stage comes before: the library is unmapped when it is freed, not when the process
        // ends.
        EXPECT_FALSE(outcome.standardOutput.contains("unloaded"));
        ASSERT_FALSE(trace().isEmpty());
        EXPECT_EQ(trace().last().section(QLatin1Char(' '), 0, 0), QLatin1String(stage));
    }
}

TEST_F(ScriptedVST3, FaultsOfOneClassLeaveTheOthersAlone)
{
    const ScannerOutcome outcome = listScript(
        traceStatement() + "class A\nclass \"B C\"\nfault initialize abort \"B C\"\ndelay initialize 1 A\n");
    EXPECT_EQ(outcome.signal, SIGABRT);
    EXPECT_TRUE(trace().contains(QStringLiteral("release A")));
    EXPECT_EQ(trace().last(), QStringLiteral("initialize B C"));
}

TEST_F(ScriptedVST3, WrongScriptsAndWrongUseFailTheTest)
{
    for (const char *script :
         {"clas A\n", "vendor V\n", "class A\nid 12\n", "fault nowhere segv\n", "fault initialize nothing\n",
          "fault initialize segv A B\n", "answer bus-count 3\n", "effect initialize umask\n",
          "generation 4\n", "class A\ninputs two\n", "class A\nask-host age\n",
          "class A\nanswer initialize fasle\n", "class A\neffect initialize locale xx_XX\n",
          "trace /nowhere/trace\n"}) {
        SCOPED_TRACE(script);
        EXPECT_NONFATAL_FAILURE(listScript(script), "fixture misused");
    }
}

TEST_F(ScriptedVST3, CallsAgainstTheRulesEndTheProcess)
{
    PluginLibrary library;
    ASSERT_TRUE(library.load(addVST3File(m_folder.plugins(), QStringLiteral("Comp"),
                                         "class A\nclass B\nanswer initialize false B\n")))
        << qPrintable(library.errorText());
    IPluginFactory &factory = *reinterpret_cast<IPluginFactory *(*)()>(library.symbol("GetPluginFactory"))();
    const auto create = [&factory](int32 index) {
        PClassInfo info;
        void *object = nullptr;
        factory.getClassInfo(index, &info);
        factory.createInstance(info.cid, Vst::IComponent::iid, &object);
        return static_cast<Vst::IComponent *>(object);
    };
    Vst::IComponent &good = *create(0);
    Vst::IComponent &refusing = *create(1);
    const auto misused = testing::ExitedWithCode(kFixtureMisused);
    EXPECT_EXIT(good.getBusCount(Vst::kAudio, Vst::kInput), misused, "not initialised");
    EXPECT_EQ(good.initialize(nullptr), kResultOk);
    EXPECT_EXIT(good.initialize(nullptr), misused, "initialised twice");
    EXPECT_EXIT(good.release(), misused, "without terminate");
    EXPECT_EQ(refusing.initialize(nullptr), kResultFalse);
    EXPECT_EXIT(refusing.release(), misused, "after initialize failed");
    good.terminate();
    EXPECT_EQ(good.release(), 0u);
    EXPECT_EXIT(good.addRef(), misused, "after its last release");
    EXPECT_EQ(factory.release(), 0u);
    EXPECT_EXIT(factory.release(), misused, "once too often");
}

TEST_F(ScriptedVST3, SideEffectsArriveInTheProcess)
{
    const struct {
        const char *effect;
        QByteArray change;
    } cases[] = {{"locale C.UTF-8", "locale C.UTF-8"},
                 {"umask 077", "umask " + QByteArray::number(077)},
                 {"chdir /", "folder /"},
                 {"rounding up", "rounding " + QByteArray::number(FE_UPWARD)},
                 {"signal term", "signal handled"},
                 {"thread", "threads 2"}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.effect);
        const ScannerOutcome outcome = listScript(QByteArray("effect get-factory ") + row.effect);
        EXPECT_EQ(outcome.standardOutput,
                  "factory: Fixture Works|||0\nchanged: " + row.change + "\nunloaded\n");
    }
    EXPECT_EQ(listScript("effect module-entry alarm 1\nfault get-factory hang\n").signal, SIGALRM);
}

TEST_F(ScriptedVST3, RunsAreAskedToEndAndKilledAtTheirLimit)
{
    ScannerRun run(kHost, m_folder);
    run.setArguments({addVST3File(m_folder.plugins(), QStringLiteral("Hang"),
                                  traceStatement() + "fault get-factory hang\n")});
    ASSERT_TRUE(run.start());
    EXPECT_TRUE(run.waitUntil([this] { return trace().contains(QStringLiteral("get-factory")); }));
    run.requestTermination();
    EXPECT_EQ(run.wait().signal, SIGTERM);

    run.setTimeLimit(std::chrono::milliseconds(200));
    ASSERT_TRUE(run.start());
    EXPECT_NONFATAL_FAILURE(run.wait(), "overran its time limit");
}

TEST_F(ScriptedVST3, RunsAreRepeatedWhileMarkersSurvive)
{
    const auto settle = [this](int mostRuns) { return runUntilSettled(kHost, m_folder, mostRuns).size(); };
    EXPECT_EQ(settle(10), 1u);
    for (const QString &marker :
         {QStringLiteral("a.scan3"), QStringLiteral("b.scan3"), QStringLiteral("c.scan3")})
        m_folder.write(QStringLiteral("Effects/") + marker, "<CrashedPlugin>");
    EXPECT_NONFATAL_FAILURE(EXPECT_EQ(settle(2), 2u), "scan3");
    m_folder.write(QStringLiteral("Effects/d.scan3"), {});
    EXPECT_EQ(settle(10), 2u);
    EXPECT_EQ(m_folder.markers(), QStringList());
}
