#include "Main/AudioEngineController/Effects/VST3/VST3Plugin.h"
#include "Tests/Support/PluginBench.h"
#include "Tests/Support/VST3Fixture.h"

namespace {

const QString kId = "00112233445566778899AABBCCDDEEFF";
const QByteArray kOwnState = "state \"a\\x00b\"\n"; // of the class of that identifier
const QByteArray kPanel = "controller Panel\nclass Panel\ncategory \"Component Controller Class\"\n";

class VST3InstanceTest : public PluginBench {
protected:
    /// The record of a class of the known identifier, of which the script tells the rest.
    EffectRecord add(const QByteArray &script, const QString &file = "Comp",
                     VST3Fixture fixture = VST3Fixture::Scripted)
    {
        const QByteArray start = tracing() + "class Comp\nid " + kId.toUtf8() + '\n';
        EffectRecord record;
        record.path = addVST3File(m_folder.plugins(), file, start + script, fixture);
        record.vendor = "Own";
        record.id = kId;
        record.name = "Listed";
        return record;
    }
};

} // namespace

TEST_F(VST3InstanceTest, IsOpenedAndClosedInOrder)
{
    const QString head = "static-constructor; module-entry; get-factory; ";
    const QString tail = "; factory-release; module-exit; static-destructor";
    const QString start = "create-instance Comp; set-io-mode Comp: 1; initialize Comp; ";
    const QString asked = "set-host-context; " + start + "controller-class-id Comp";
    const QString end = "terminate Comp; release Comp";
    const QString made = "; create-instance Panel; initialize Panel";
    const QString joined = "; set-component-handler Panel; connect Comp; connect Panel; get-state Comp; "
                           "set-component-state Panel: a\\x00b";
    const QString parted = "disconnect Comp; disconnect Panel; set-component-handler Panel: null; "
                           "terminate Panel; release Panel; ";
    const struct {
        QByteArray script;
        QString opening, closing;
    } cases[] = {{"answer set-io-mode internal-error", asked, end},
                 {"generation 2", start + "controller-class-id Comp", end},
                 {"controller self", "set-host-context; " + start + "set-component-handler Comp",
                  "set-component-handler Comp: null; " + end},
                 {kOwnState + kPanel, asked + made + joined, parted + end},
                 {"controller Nobody", asked, end},
                 {kPanel + "answer initialize false Panel", asked + made, end}};
    VST3Plugin plugin;
    for (const auto &row : cases) {
        SCOPED_TRACE(row.script.constData());
        EffectRecord record = add("factory-vendor Factory\n" + row.script, "Row");
        record.vendor.clear();
        EXPECT_TRUE(plugin.openClass(record) && plugin.isInstantiated());
        EXPECT_TRUE(takeTrace().endsWith(head + row.opening + "; factory-info"));
        EXPECT_EQ(plugin.vendor() + ' ' + plugin.identifier() + ' ' + plugin.name(),
                  "Factory vst3:" + kId + " Listed");
        EXPECT_TRUE(plugin.openClass(add({}))) << "in place of the one before";
        EXPECT_EQ(plugin.vendor(), "Own");
        EXPECT_TRUE(takeTrace().startsWith(row.closing + tail));
    }
}

TEST_F(VST3InstanceTest, FailuresHaveTheirLinesAndLeaveTheObjectUsable)
{
    const QString noModule = "VST3 Exception: Failed to get load module:";
    const QString noFactory = "VST3 Exception: Failed to get factory function";
    const struct {
        QByteArray script;
        QString line;
        QString id = kId;
        VST3Fixture fixture = VST3Fixture::Scripted;
    } cases[] = {
        {"", noFactory, kId, VST3Fixture::NoEntry},
        {"answer module-entry false", noModule + m_folder.plugins()},
        {"", "'0x112233445566778899AABBCCDDEEFF' is not a class", "0x112233445566778899AABBCCDDEEFF"},
        {"answer create-instance null", "The component could not be created (result 0x00000000)"},
        {"controller self\nanswer initialize false",
         "The component could not be initialised (result 0x00000001)"},
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
    auto plugin = std::make_unique<VST3Plugin>();
    const QByteArray others = kPanel + "fault connect throw-int Panel\nfault disconnect throw-int\n";
    EXPECT_THROW(plugin->openClass(add(others)), int) << "other exceptions reach the caller";
    EXPECT_FALSE(plugin->isInstantiated());
    plugin.reset();
    EXPECT_TRUE(takeTrace().contains("terminate Panel; release Panel; terminate Comp; release Comp"));
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
    const auto takes = [&](const QByteArray &data, const QString &id) {
        preset.data = data;
        preset.identifier = id;
        return plugin.LoadPreset(preset);
    };
    takeTrace();
    EXPECT_TRUE(takes(QByteArray(stored).replace(8, 1, "c"), "vst3:" + kId));
    EXPECT_EQ(takeTrace(), "set-state Comp: c\\x00b; set-component-state Panel: c\\x00b; "
                           "set-state Panel: panel");
    for (int size = 0; size < stored.size(); ++size)
        EXPECT_FALSE(takes(stored.left(size), "vst3:" + kId)) << size << " bytes of it";
    EXPECT_FALSE(takes(stored + '\0', "vst3:" + kId)) << "one byte more";
    EXPECT_FALSE(takes(stored, "vst3:1" + kId.mid(1))) << "of another";
    EXPECT_EQ(takeTrace(), QString()) << "the plug-in heard of none";
    ASSERT_TRUE(
        plugin.openClass(add("state x\nanswer get-state false\nfault set-state throw-int\n", "Liar")));
    EXPECT_FALSE(plugin.StorePreset(preset));
    EXPECT_EQ(preset.data, stored) << "as it was";
    EXPECT_FALSE(takes(stored, plugin.identifier()));
}
