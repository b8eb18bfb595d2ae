#include "Tests/Main/AudioEngineController/Effects/VST/VSTInstanceBench.h"

#include "Core/BaseLib/Log/DebugLog.h"

namespace {

class VSTPluginTest : public VSTInstanceBench {
protected:
    QString add(const QByteArray &script = {}, const char *name = "Comp",
                VST2Fixture fixture = VST2Fixture::Scripted) const
    {
        return addVST2File(m_folder.plugins(), name, tracing() + script, fixture);
    }
    static bool load(VSTPlugin &plugin, const QString &path)
    {
        bool isPluginModule = false;
        return plugin.load(path, VSTHostCallback, isPluginModule) && isPluginModule;
    }
    static EffectRecord record(const QString &path, quint32 subId = 0)
    {
        EffectRecord result;
        result.path = path;
        result.subId = subId;
        return result;
    }
    EffectRecord probe(const QByteArray &script)
    {
        VSTPlugin plugin(m_host);
        EffectRecord result;
        EXPECT_TRUE(load(plugin, add(script)));
        plugin.readInto(result);
        return result;
    }
};

} // namespace

TEST_F(VSTPluginTest, FailuresAreToldApartAndLeaveTheObjectUsable)
{
    const struct {
        const char *name;
        const char *script; // null: no such file
        VST2Fixture fixture;
        bool isPluginModule, isInvalid;
    } cases[] = {{"null effect", "answer entry null", VST2Fixture::Scripted, true, false},
                 {"wrong magic", "magic 0x50747356", VST2Fixture::Scripted, true, true},
                 {"effect outside of memory", "answer entry no-memory", VST2Fixture::Scripted, true, true},
                 {"exception", "fault entry throw-int", VST2Fixture::Scripted, true, false},
                 {"fault", "fault entry segv", VST2Fixture::Scripted, true, false},
                 {"no entry point", "", VST2Fixture::NoEntry, false, false},
                 {"missing module", nullptr, VST2Fixture::Scripted, true, false}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        const QString path = row.script ? add(row.script, row.name, row.fixture) : m_folder.path(row.name);
        const CapturedLog log;
        VSTPlugin plugin(m_host);
        bool isPluginModule = !row.isPluginModule;
        EXPECT_FALSE(plugin.load(path, VSTHostCallback, isPluginModule));
        EXPECT_EQ(isPluginModule, row.isPluginModule);
        EXPECT_FALSE(plugin.isProbe());
        EXPECT_FALSE(log.contains("VSTPlugin::Load")) << "a scan has its own line";
        EXPECT_FALSE(plugin.load(record(path), VSTHostCallback, 0));
        QStringList expected{"VSTPlugin::Load - Failed to Load DLL: " + path};
        if (row.isInvalid)
            expected.prepend("VSTPlugin::Load - Invalid VST Plugin");
        EXPECT_EQ(log.lines().filter("VSTPlugin::Load"), expected);
        EXPECT_FALSE(m_host.shellIdOfPluginBeingLoaded(*std::make_unique<VstInt32>()));
        EXPECT_TRUE(plugin.load(record(add("name Good", "Good")), VSTHostCallback, 0));
        EXPECT_EQ(plugin.name(), "Good");
    }
}

TEST_F(VSTPluginTest, WhoIsAskedForItsName)
{
    const struct {
        const char *name;
        const char *file;
        const char *script;
        quint32 subId;
        const char *expected;
    } cases[] = {
        {"effect", "Comp", "name Told", 0, "Told"},
        {"instrument with inputs", "My Synth.x64", "name Told\ncategory 2", 0, "My Synth"},
        {"no inputs", "Caf\xC3\xA9", "name Told\ninputs 0", 0, "Caf\xC3\xA9"},
        {"negative inputs", "Comp", "name Told\ninputs -1", 0, "Told"},
        {"child without inputs", "Shell", "child 11 Told\ninputs 0", 11, "Told"},
        {"instrument child with inputs", "Shell", "child 11 Told\ncategory 2", 11, "Told"},
        {"child of a negative number", "Shell", "child -2 Told\ninputs 0", 0xFFFFFFFE, "Told"},
        {"nothing told", "Comp.64.x", "name Told\nname \"\"\nanswer get-effect-name 0", 0, "Comp"},
        {"an empty name told", "Comp", "name \"\"", 0, ""},
        {"a name told in spite of 0", "Comp", "name Told\nanswer get-effect-name 0", 0, "Told"},
        {"hidden file", ".Comp", "inputs 0", 0, ""},
        {"bytes are Latin-1", "Comp", "name \\xC9t\\xE9\\xFF\\x80", 0, "\xC3\x89t\xC3\xA9\xC3\xBF\xC2\x80"}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        VSTPlugin plugin(m_host);
        EXPECT_TRUE(plugin.load(record(add(row.script, row.file), row.subId), VSTHostCallback, 0));
        EXPECT_EQ(plugin.name(), row.expected);
    }
}

TEST_F(VSTPluginTest, APathWithoutASlashGivesNoName)
{
    VSTPlugin plugin(m_host);
    EXPECT_TRUE(plugin.load(record(add("inputs 0")), VSTHostCallback, 0));
    EXPECT_TRUE(plugin.load(record("Comp.so"), VSTHostCallback, 1));
    EXPECT_EQ(plugin.name(), QString());
    EXPECT_EQ(plugin.key(), ":1000");
}

TEST_F(VSTPluginTest, TextsEndAtTheBuffer)
{
    const QString name(1024, 'n'), vendor(256, 'v');
    const EffectRecord read = probe(("name " + name + "\nvendor " + vendor + "\n").toUtf8());
    EXPECT_EQ(read.name, name);
    EXPECT_EQ(read.vendor, vendor);
    EXPECT_EQ(read.id, name.left(255)) << "the key is cut";
    EXPECT_EQ(probe("name " + QByteArray(250, 'n')).id, QString(250, 'n') + ":1000");
    EXPECT_EQ(probe("name " + QByteArray(251, 'n')).id, QString(251, 'n') + ":100");
}

TEST_F(VSTPluginTest, Mode0AndAThrowingEntryCloseAndUnloadWhatWasHeld)
{
    const QString path = add("child 11 A\nchild 12 B\nchild 13 C\nfault entry throw-std C\n", "Shell");
    VSTPlugin plugin(m_host);
    EXPECT_TRUE(load(plugin, path));
    EXPECT_TRUE(plugin.isProbe());
    EXPECT_TRUE(plugin.load(record(path, 11), VSTHostCallback, 1));
    EXPECT_FALSE(plugin.isProbe());
    EXPECT_EQ(plugin.shellId(), 11);
    takeTrace();
    EXPECT_TRUE(plugin.load(record(path, 12), VSTHostCallback, 0));
    EXPECT_EQ(takeTrace(), "close A; close Shell; static-destructor; static-constructor; entry B: 12; "
                           "get-plug-category B; get-effect-name B");
    EXPECT_FALSE(plugin.load(record(path, 13), VSTHostCallback, 1));
    EXPECT_EQ(takeTrace(), "entry C: 13; close B; static-destructor");
    EXPECT_TRUE(plugin.load(record(path, 11), VSTHostCallback, 1)) << "the module is loaded anew";
}

TEST_F(VSTPluginTest, ACallThatFailsSaysWhyAndAnswersZero)
{
    const std::pair<const char *, const char *> rows[] = {
        {"segv", ": SE Exception: Access Violation"},
        {"throw-std", " threw: thrown by the fixture"},
        {"throw-int", " threw something that is no standard exception"}};
    for (const auto &[kind, line] : rows) {
        const QByteArray script = QByteArray("fault get-vendor-string ") + kind;
        // A file of its own: a module in which a fault was caught stays in memory.
        VSTPlugin plugin(m_host);
        EffectRecord result;
        EXPECT_TRUE(load(plugin, add(script, kind)));
        plugin.readInto(result);
        EXPECT_EQ(result.vendor, QString()) << kind;
        EXPECT_TRUE(m_log.contains(QLatin1String("VST plug-in call 47") + line)) << kind;
    }
}

TEST_F(VSTPluginTest, AFaultInsideNestedHostCallsLeavesTheCounterAsItWas)
{
    probe("ask-host get-vendor-string 1 nested 5\nfault edit-idle segv\n");
    EXPECT_EQ(VSTCallbackNesting::active(), 0);
    VSTPlugin thrower(m_host);
    load(thrower, add("ask-host entry 1 nested 5\nfault edit-idle throw-int\n", "Thrower"));
    EXPECT_EQ(VSTCallbackNesting::active(), 0);
}

TEST_F(VSTPluginTest, DispatchesAreTraced)
{
    VSTEffect nothing;
    EXPECT_EQ(nothing.dispatch(effClose), 0);
    EXPECT_TRUE(m_log.contains("\"0 != _plugin\""));
    const CapturedLog log;
    debugLogSettings().trace = true;
    AEffect effect = {};
    effect.dispatcher = [](AEffect *, int opcode, int, VstIntPtr value, void *pointer, float number) {
        return opcode + value + reinterpret_cast<VstIntPtr>(pointer) + static_cast<VstIntPtr>(number * 4);
    };
    VSTEffect held(&effect);
    EXPECT_EQ(held.dispatch(100), 100);
    EXPECT_EQ(held.dispatch(100, reinterpret_cast<void *>(0x10)), 116);
    EXPECT_EQ(held.dispatchValue(100, -7), 93);
    EXPECT_EQ(held.dispatchFloat(100, 0.25f), 101);
    EXPECT_EQ(log.lines(), QStringList({"VST Plugin Dispatch(100,0x10);", "VST Plugin Dispatch(100,-7);",
                                        "VST Plugin Dispatch(100,0.250000);"}));
}
