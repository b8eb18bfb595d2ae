#include "Main/AudioEngineController/Effects/VST3/VST3Plugin.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST3Fixture.h"

#include <gtest/gtest.h>

namespace {

const QString kId = "00112233445566778899AABBCCDDEEFF";
/// What follows the class of that identifier.
const QByteArray kOwnState = "state \"a\\x00b\"\n";
const QByteArray kPanel = "controller Panel\nclass Panel\ncategory \"Component Controller Class\"\n";

class VST3InstanceTest : public testing::Test {
protected:
    /// The record of a class of the known identifier, of which the script tells the rest.
    EffectRecord add(const QByteArray &script, const QString &file = "Comp",
                     VST3Fixture fixture = VST3Fixture::Scripted)
    {
        const QByteArray start =
            "trace \"" + m_folder.path("trace").toUtf8() + "\"\nclass Comp\nid " + kId.toUtf8() + '\n';
        EffectRecord record;
        record.path = addVST3File(m_folder.plugins(), file, start + script, fixture);
        record.vendor = "Own";
        record.id = kId;
        record.name = "Listed";
        return record;
    }
    /// The calls since the last time.
    QString takeTrace() const
    {
        const QStringList lines = m_folder.lines("trace");
        m_folder.write("trace", {});
        return lines.join("; ");
    }

    TestFolder m_folder;
    const CapturedLog m_log;
};

} // namespace

TEST_F(VST3InstanceTest, IsOpenedAndClosedInOrder)
{
    const QString head = "static-constructor; module-entry; get-factory; ";
    const QString tail = "; factory-release; module-exit; static-destructor";
    const QString start = "create-instance Comp; set-io-mode Comp: 1; initialize Comp; ";
    const QString asked = "set-host-context; " + start + "controller-class-id Comp";
    const QString end = "terminate Comp; release Comp";
    const struct {
        const char *name;
        QByteArray script;
        QString opening, closing;
    } cases[] = {
        {"no controller", "", asked, end},
        {"older factory", "generation 2", start + "controller-class-id Comp", end},
        {"the component itself", "controller self",
         "set-host-context; " + start + "set-component-handler Comp",
         "set-component-handler Comp: null; " + end},
        {"another object", kOwnState + kPanel,
         asked + "; create-instance Panel; initialize Panel; set-component-handler Panel; connect Comp; "
                 "connect Panel; get-state Comp; set-component-state Panel: a\\x00b",
         "disconnect Comp; disconnect Panel; set-component-handler Panel: null; terminate Panel; "
         "release Panel; " +
             end},
        {"one of a factory that lies", "controller Nobody", asked, end},
        {"one that cannot be made", kPanel + "answer create-instance false Panel",
         asked + "; create-instance Panel", end},
        {"one that does not start", kPanel + "answer initialize false Panel",
         asked + "; create-instance Panel; initialize Panel", end},
        {"a component that answers anything to the mode", "answer set-io-mode internal-error", asked, end}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        auto plugin = std::make_unique<VST3Plugin>();
        EXPECT_TRUE(plugin->openClass(add(row.script)) && plugin->isInstantiated());
        EXPECT_EQ(takeTrace(), head + row.opening);
        plugin.reset();
        EXPECT_EQ(takeTrace(), row.closing + tail);
    }
}

TEST_F(VST3InstanceTest, FailuresHaveTheirLinesAndLeaveTheObjectUsable)
{
    const struct {
        QByteArray script;
        QString line;
        QString id = kId;
        VST3Fixture fixture = VST3Fixture::Scripted;
    } cases[] = {
        {"", "VST3 Exception: Failed to get factory function", kId, VST3Fixture::NoEntry},
        {"answer module-entry false", "VST3 Exception: Failed to get load module:"},
        {"answer get-factory null", "VST3 Exception: Failed to get factory function"},
        {"generation 0", "VST3 Exception: Failed to get factory function"},
        {"", "The component could not be created", "FF112233445566778899AABBCCDDEEFF"},
        {"", "'Comp' is not a class identifier", "Comp"},
        {"", "is not a class identifier", "0x112233445566778899AABBCCDDEEFF"},
        {"answer create-instance null", "The component could not be created: 0x00000000"},
        {"controller self\nanswer initialize false", "The component could not be initialised: 0x00000001"},
        {"fault initialize throw-std", "thrown by the fixture"},
        {kPanel + "fault connect throw-std Panel", "thrown by the fixture"}};
    for (const auto &row : cases) {
        SCOPED_TRACE((row.script + ", " + row.line.toUtf8()).constData());
        EffectRecord record = add(row.script, QString::number(&row - cases), row.fixture);
        record.id = row.id;
        VST3Plugin plugin;
        EXPECT_FALSE(plugin.openClass(record));
        EXPECT_TRUE(m_log.lines().last().contains(row.line));
        EXPECT_FALSE(plugin.isInstantiated() || plugin.open({48000, 64}));
        takeTrace();
        EXPECT_TRUE(plugin.openClass(add({})));
        EXPECT_FALSE(takeTrace().contains("terminate")) << "what failed is not called again";
    }
    EffectRecord gone = add({});
    gone.path = m_folder.path("gone.vst3");
    EXPECT_FALSE(VST3Plugin().openClass(gone));
    EXPECT_TRUE(m_log.contains("VST3 Exception: Failed to get load module:" + gone.path));
}

TEST_F(VST3InstanceTest, OtherExceptionsReachTheCaller)
{
    auto plugin = std::make_unique<VST3Plugin>();
    EXPECT_THROW(
        plugin->openClass(add(kPanel + "fault connect throw-int Panel\nfault disconnect throw-int\n")), int);
    EXPECT_FALSE(plugin->isInstantiated());
    plugin.reset();
    EXPECT_TRUE(takeTrace().contains("terminate Panel; release Panel; terminate Comp; release Comp"));
}

TEST_F(VST3InstanceTest, TheRecordDescribesTheInstance)
{
    EffectRecord record = add("vendor Class\nfactory-vendor Factory\n");
    record.inputs = 3;
    record.category = 8;
    VST3Plugin plugin;
    EXPECT_TRUE(plugin.openClass(record));
    EXPECT_EQ(plugin.vendor(), "Own");
    EXPECT_EQ(plugin.record().inputs, 3);
    EXPECT_EQ(plugin.record().category, 8u);
    EXPECT_EQ(plugin.identifier(), "vst3:" + kId);
    EXPECT_EQ(plugin.name(), "Listed");
    record.vendor.clear();
    EXPECT_TRUE(plugin.openClass(record)) << "in place of the one before";
    EXPECT_EQ(plugin.vendor(), "Factory");
}

TEST_F(VST3InstanceTest, StateIsStoredAndLoaded)
{
    VST3Plugin plugin;
    ASSERT_TRUE(plugin.openClass(add(kOwnState + kPanel + "state panel\n")));
    PluginPreset preset;
    ASSERT_TRUE(plugin.StorePreset(preset));
    const QByteArray stored = QByteArray("\1\0\0\0\3\0\0\0a\0b\5\0\0\0panel", 20);
    EXPECT_EQ(preset.data, stored);
    EXPECT_EQ(preset.identifier, "vst3:" + kId);
    preset.data[8] = 'c';
    takeTrace();
    EXPECT_TRUE(plugin.LoadPreset(preset));
    EXPECT_EQ(takeTrace(), "set-state Comp: c\\x00b; set-component-state Panel: c\\x00b; "
                           "set-state Panel: panel");
    PluginPreset again;
    EXPECT_TRUE(plugin.StorePreset(again));
    EXPECT_EQ(again.data, preset.data);

    takeTrace();
    for (int size = 0; size < stored.size(); ++size) {
        preset.data = stored.left(size);
        EXPECT_FALSE(plugin.LoadPreset(preset)) << size << " bytes of it";
    }
    preset.data = stored + '\0';
    EXPECT_FALSE(plugin.LoadPreset(preset)) << "one byte more";
    preset.data = stored;
    preset.identifier.replace('0', '1');
    EXPECT_FALSE(plugin.LoadPreset(preset)) << "of another";
    EXPECT_EQ(takeTrace(), QString()) << "the plug-in heard of none";
}

TEST_F(VST3InstanceTest, AStateThatCannotBeHadOrSetIsAFailure)
{
    const struct {
        const char *script;
        bool stored, loaded;
    } rows[] = {{"", false, false},
                {"state x\nanswer get-state false", false, false},
                {"state x\nfault get-state throw-int", false, false},
                {"state x\nanswer set-state false", true, true}, // it has that state, whatever it answers
                {"state x\nfault set-state throw-std", true, false}};
    for (const auto &row : rows) {
        SCOPED_TRACE(row.script);
        VST3Plugin plugin;
        ASSERT_TRUE(plugin.openClass(add(row.script)));
        PluginPreset preset;
        preset.data = "kept";
        EXPECT_EQ(plugin.StorePreset(preset), row.stored);
        EXPECT_EQ(preset.data == "kept", !row.stored);
        EXPECT_EQ(plugin.LoadPreset(preset), row.loaded);
        preset.data.replace('x', 'y');
        EXPECT_FALSE(plugin.LoadPreset(preset));
    }
}
