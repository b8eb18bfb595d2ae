#include "Main/AudioEngineController/Effects/VST3/VST3Plugin.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST3Fixture.h"

#include <gtest/gtest.h>

namespace {

const char kId[] = "00112233445566778899AABBCCDDEEFF";
/// What follows the class of that identifier.
const QByteArray kOwnState = "state \"a\\x00b\"\n";
const QByteArray kPanel = "controller Panel\nclass Panel\ncategory \"Component Controller Class\"\n";

class VST3InstanceTest : public testing::Test {
protected:
    /// The record of a class of the known identifier, of which the script tells the rest.
    EffectRecord add(const QByteArray &script, const char *file = "Comp",
                     VST3Fixture fixture = VST3Fixture::Scripted)
    {
        const QByteArray start =
            "trace \"" + m_folder.path(QStringLiteral("trace")).toUtf8() + "\"\nclass Comp\nid " + kId + '\n';
        EffectRecord record;
        record.path = addVST3File(m_folder.plugins(), QString::fromUtf8(file), start + script, fixture);
        record.vendor = QStringLiteral("Own");
        record.id = QString::fromLatin1(kId);
        record.name = QStringLiteral("Listed");
        return record;
    }
    /// The calls since the last time.
    QString takeTrace() const
    {
        const QStringList lines = m_folder.lines(QStringLiteral("trace"));
        m_folder.write(QStringLiteral("trace"), {});
        return lines.join(QStringLiteral("; "));
    }

    TestFolder m_folder;
    const CapturedLog m_log;
};

} // namespace

TEST_F(VST3InstanceTest, IsOpenedAndClosedInOrder)
{
    const QString head = QStringLiteral("static-constructor; module-entry; get-factory; ");
    const QString tail = QStringLiteral("; factory-release; module-exit; static-destructor");
    const QString start = QStringLiteral("create-instance Comp; set-io-mode Comp: 1; initialize Comp; ");
    const QString asked = "set-host-context; " + start + "controller-class-id Comp";
    const QString end = QStringLiteral("terminate Comp; release Comp");
    const struct {
        const char *name;
        QByteArray script;
        QString opening;
        QString closing;
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
        const EffectRecord record = add(row.script);
        {
            VST3Plugin plugin;
            EXPECT_TRUE(plugin.openClass(record));
            EXPECT_EQ(takeTrace(), head + row.opening);
            EXPECT_TRUE(plugin.isInstantiated());
        }
        EXPECT_EQ(takeTrace(), row.closing + tail);
    }
}

TEST_F(VST3InstanceTest, FailuresHaveTheirLinesAndLeaveTheObjectUsable)
{
    const struct {
        const char *name;
        QByteArray script;
        VST3Fixture fixture;
        const char *id;
        const char *line;
    } cases[] = {
        {"no entry point", "", VST3Fixture::NoEntry, kId, "VST3 Exception: Failed to get factory function"},
        {"does not start", "answer module-entry false", VST3Fixture::Scripted, kId,
         "VST3 Exception: Failed to get load module:"},
        {"null factory", "answer get-factory null", VST3Fixture::Scripted, kId,
         "VST3 Exception: Failed to get factory function"},
        {"factory without its interface", "generation 0", VST3Fixture::Scripted, kId,
         "VST3 Exception: Failed to get factory function"},
        {"class that is not there", "", VST3Fixture::Scripted, "FF112233445566778899AABBCCDDEEFF",
         "The component could not be created"},
        {"no identifier", "", VST3Fixture::Scripted, "Comp", "'Comp' is no class identifier"},
        {"digits that are none", "", VST3Fixture::Scripted, "0x112233445566778899AABBCCDDEEFF",
         "is no class identifier"},
        {"success without an object", "answer create-instance null", VST3Fixture::Scripted, kId,
         "The component could not be created: 0x00000000"},
        {"does not initialise", "controller self\nanswer initialize false", VST3Fixture::Scripted, kId,
         "The component could not be initialised: 0x00000001"},
        {"throws", "fault initialize throw-std", VST3Fixture::Scripted, kId, "thrown by the fixture"},
        {"throws when it is there", kPanel + "fault connect throw-std Panel", VST3Fixture::Scripted, kId,
         "thrown by the fixture"}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        EffectRecord record = add(row.script, row.name, row.fixture);
        record.id = QString::fromLatin1(row.id);
        VST3Plugin plugin;
        EXPECT_FALSE(plugin.openClass(record));
        EXPECT_TRUE(m_log.lines().last().contains(QLatin1String(row.line)));
        EXPECT_FALSE(plugin.isInstantiated() || plugin.open({48000, 64}));
        takeTrace();
        EXPECT_TRUE(plugin.openClass(add({})));
        EXPECT_FALSE(takeTrace().contains(QStringLiteral("terminate"))) << "what failed is not called again";
    }
    VST3Plugin missing;
    EffectRecord gone = add({});
    gone.path = m_folder.path(QStringLiteral("gone.vst3"));
    EXPECT_FALSE(missing.openClass(gone));
    EXPECT_TRUE(m_log.contains("VST3 Exception: Failed to get load module:" + gone.path));
}

TEST_F(VST3InstanceTest, OtherExceptionsReachTheCaller)
{
    const EffectRecord record = add(kPanel + "fault connect throw-int Panel\nfault disconnect throw-int\n");
    {
        VST3Plugin plugin;
        EXPECT_THROW(plugin.openClass(record), int);
        EXPECT_FALSE(plugin.isInstantiated());
    }
    EXPECT_TRUE(
        takeTrace().contains(QStringLiteral("terminate Panel; release Panel; terminate Comp; release Comp")));
}

TEST_F(VST3InstanceTest, TheRecordDescribesTheInstance)
{
    EffectRecord record = add("vendor Class\nfactory-vendor Factory\n");
    record.inputs = 3;
    record.category = 8;
    VST3Plugin plugin;
    EXPECT_TRUE(plugin.openClass(record));
    EXPECT_EQ(plugin.vendor(), QStringLiteral("Own"));
    EXPECT_EQ(plugin.record().inputs, 3);
    EXPECT_EQ(plugin.record().category, 8u);
    EXPECT_EQ(plugin.identifier(), QStringLiteral("vst3:") + kId);
    EXPECT_EQ(plugin.name(), QStringLiteral("Listed"));
    record.vendor.clear();
    EXPECT_TRUE(plugin.openClass(record)) << "in place of the one before";
    EXPECT_EQ(plugin.vendor(), QStringLiteral("Factory"));
}

TEST_F(VST3InstanceTest, StateIsStoredAndLoaded)
{
    VST3Plugin plugin;
    ASSERT_TRUE(plugin.openClass(add(kOwnState + kPanel + "state panel\n")));
    PluginPreset preset;
    ASSERT_TRUE(plugin.StorePreset(preset));
    const QByteArray stored = QByteArray("\1\0\0\0\3\0\0\0a\0b\5\0\0\0panel", 20);
    EXPECT_EQ(preset.data, stored);
    EXPECT_EQ(preset.identifier, QStringLiteral("vst3:") + kId);
    preset.data[8] = 'c';
    takeTrace();
    EXPECT_TRUE(plugin.LoadPreset(preset));
    EXPECT_EQ(takeTrace(), QStringLiteral("set-state Comp: c\\x00b; set-component-state Panel: c\\x00b; "
                                          "set-state Panel: panel"));
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
    preset.identifier.replace(QLatin1Char('0'), QLatin1Char('1'));
    EXPECT_FALSE(plugin.LoadPreset(preset)) << "of another";
    EXPECT_EQ(takeTrace(), QString()) << "the plug-in heard of none";
}

TEST_F(VST3InstanceTest, AStateThatCannotBeHadOrSetIsAFailure)
{
    for (const char *script : {"", "state x\nanswer get-state false", "state x\nfault get-state throw-int"}) {
        VST3Plugin plugin;
        ASSERT_TRUE(plugin.openClass(add(script)));
        PluginPreset preset;
        preset.data = "kept";
        EXPECT_FALSE(plugin.StorePreset(preset)) << script;
        EXPECT_EQ(preset.data, "kept");
    }
    for (const char *script : {"state x\nanswer set-state false", "state x\nfault set-state throw-std"}) {
        VST3Plugin plugin;
        ASSERT_TRUE(plugin.openClass(add(script)));
        PluginPreset preset;
        EXPECT_TRUE(plugin.StorePreset(preset));
        EXPECT_EQ(plugin.LoadPreset(preset), QByteArray(script).contains("answer"))
            << "it has that state, whatever it answers";
        preset.data[8] = 'y';
        EXPECT_FALSE(plugin.LoadPreset(preset)) << script;
    }
}
