#include "Main/AudioEngineController/Effects/VST3/VST3Probe.h"
#include "Tests/Support/PluginBench.h"
#include "Tests/Support/VST3Fixture.h"

#include <QtEndian>

namespace {

class VST3ProbeTest : public PluginBench {
protected:
    ProbeOutcome probe(const QString &name, const QByteArray &script,
                       VST3Fixture fixture = VST3Fixture::Scripted)
    {
        return PluginBench::probe(VST3Probe(),
                                  addVST3File(m_folder.plugins(), name, tracing() + script + '\n', fixture));
    }
};

} // namespace

TEST_F(VST3ProbeTest, OutcomesAndWhatTheObserverHears)
{
    const QString thrown = "it threw: thrown by the fixture", none = "it lists no audio plug-in among its ";
    const struct {
        const char *name;
        QByteArray script;
        QString heard;
        QString outcome; ///< the classes listed, or what becomes of the catalogue; and the reason
        VST3Fixture fixture = VST3Fixture::Scripted;
    } rows[] = {
        {"six", "class 1\nclass 2\nclass 3\nclass 4\nclass 5\nclass 6", "load start ask 1 2 3 4 5 6 close",
         "1 2 3 4 5 6: "},
        {"seven are announced", "class A\nanswer count-classes 7", "load start ask A ! close", "A: "},
        {"a name twice", "class A\nclass A\nclass C", "load start ask A C close", "A C: "},
        {"a count too high", "class A\nanswer count-classes 2147483647", "load start ask A ! close", "A: "},
        {"a negative count", "answer count-classes -5", "load start ask close",
         "record: " + none + "-5 classes"},
        {"not initialised", "class A\nclass B\nanswer initialize false A", "load start ask A B close",
         "B: its class \"A\" could not be initialised (result 0x00000001)"},
        {"not created", "class A\nclass B\nanswer create-instance null", "load start ask A B close",
         "record: its class \"A\" could not be created (result 0x00000000)"},
        {"other categories",
         "class 1\ncategory \"Component Controller Class\"\nclass 2\ncategory \"Audio Module\"\n"
         "class 3\ncategory \"Audio Module Class and 32 bytes!!\"\nclass 4\ncategory \"audio module class\"",
         "load start ask close", "record: " + none + "4 classes"},
        {"throws in the middle", "class A\nclass B\nclass C\nfault bus-count throw-std B",
         "load start ask A B close", "A: " + thrown},
        {"throws no exception", "fault count-classes throw-int", "load start ask close",
         "record: it threw something other than a standard exception"},
        {"throws while closed", "class A\nfault factory-release throw-int\nfault module-exit throw-std",
         "load start ask A close", "A: "},
        {"does not start", "answer module-entry false", "load start close",
         "record: its entry function reports that it could not start"},
        {"throws at its start", "fault module-entry throw-std", "load start close", "record: " + thrown},
        {"WaveShell", "", "load start ask close", "keep: " + none + "0 classes"},
        {"WaveShell without factory", "answer get-factory null", "load start ask close",
         "keep: GetPluginFactory returned null"},
        {"factory throws", "fault get-factory throw-std", "load start ask close", "keep: " + thrown},
        {"another factory", "generation 0", "load start ask close",
         "keep: its factory does not offer IPluginFactory"},
        {"no export", "", "load start ask close", "keep: it does not export GetPluginFactory",
         VST3Fixture::NoEntry},
        {"leaves a thread", "class A\neffect initialize thread", "load start ask A close",
         "A left threads: "}};
    for (const auto &row : rows) {
        const ProbeOutcome outcome = probe(row.name, row.script, row.fixture);
        EXPECT_EQ(m_observer.heard.join(' '), row.heard) << row.name;
        QStringList listed;
        for (const EffectRecord &record : outcome.records) {
            listed << record.name;
            EXPECT_EQ(record.path + record.fileTime, m_folder.plugins() + '/' + row.name + ".vst3its time");
        }
        EXPECT_EQ(outcome.status, listed.isEmpty() ? ProbeStatus::Failed : ProbeStatus::Listed) << row.name;
        if (listed.isEmpty())
            listed << QStringList{"record", "keep"}.at(static_cast<int>(outcome.ifFailed));
        expectStage(outcome);
        EXPECT_EQ(listed.join(' ') + (outcome.leftThreads ? " left threads: " : ": ") + outcome.reason,
                  row.outcome);
    }
}

TEST_F(VST3ProbeTest, AClassIsWhatTheFormsSayThatAreAnswered)
{
    // In the older forms the bytes E9 are no UTF-8; in UTF-16 they are a letter.
    const QByteArray accented = "class \"A\xE9\"\nvendor \"V\xE9\"\nsubcategories Fx|EQ\n";
    const QByteArray no1 = accented + "answer class-info false\n", no2 = "answer class-info2 false\n",
                     no3 = "answer class-info-unicode false\n", longText(64, 'n');
    const struct {
        QByteArray script, record; ///< name, vendor and sub-categories; empty where nothing is listed
    } rows[] = {{accented, "A\uFFFD|V\uFFFD|Fx|EQ"},
                {accented + no2, "A\uFFFD|Fixture Works|"},
                {no1, "A\u00E9|V\u00E9|Fx|EQ"},
                {no1 + no2, "A\u00E9|V\u00E9|Fx|EQ"},
                {no1 + no3, "A\uFFFD|V\uFFFD|Fx|EQ"},
                {no1 + no2 + no3, ""},
                {no1 + "generation 2", "A\uFFFD|V\uFFFD|Fx|EQ"},
                {no1 + "generation 1", ""},
                {no1 + "category Audio", ""},
                {"generation 1\nclass A\nvendor Unasked", "A|Fixture Works|"},
                {"factory-vendor \"\"\nclass A", "A||Fx"},
                {"class A\nanswer factory-info false", "A||Fx"},
                {"class \"\"", "|Fixture Works|Fx"},
                {"class \"🎛 リバーブ\"", "🎛 リバーブ|Fixture Works|Fx"},
                {"class " + longText + "\nvendor " + longText + "\nsubcategories " + longText + longText,
                 longText + '|' + longText + '|' + longText + longText}};
    for (const auto &row : rows) {
        QStringList found;
        for (const EffectRecord &record : probe("Forms", row.script).records)
            found << record.name + '|' + record.vendor + '|' + record.categories;
        EXPECT_EQ(found.join(' '), QString::fromUtf8(row.record)) << row.script.constData();
    }
}

TEST_F(VST3ProbeTest, AModuleForAnotherMachineIsNotLoaded)
{
    QByteArray module = m_folder.read(vst3FixturePath());
    const bool isElf = module.startsWith("\x7F"
                                         "ELF");
    const int machine = isElf ? 18 : qFromLittleEndian<int>(module.constData() + 0x3C) + 4;
    qToLittleEndian<quint16>(isElf ? 183 : 0xAA64, module.data() + machine);
    m_folder.write("arm.vst3", module);
    const ProbeOutcome outcome = PluginBench::probe(VST3Probe(), m_folder.path("arm.vst3"));
    EXPECT_EQ(m_observer.heard, QStringList("load"));
    EXPECT_EQ(outcome.ifFailed, ProbeOutcome::IfFailed::Record);
    EXPECT_EQ(outcome.reason, "it is built for 64-bit ARM; this machine needs 64-bit x86");
}

TEST_F(VST3ProbeTest, BusesGiveTheChannels)
{
    const struct {
        const char *name, *script;
        int inputs, outputs;
    } rows[] = {{"one direction", "inputs 1\noutputs\n", 1, 0},
                {"main buses add up, others do not count", "inputs 1:aux 2 6 2:aux\n", 8, 2},
                {"none is main", "inputs 2:aux 1:aux\noutputs 2:7 3:-1\n", 3, 5},
                {"a main bus without channels before a side chain", "inputs 0 2:aux\n", 0, 2},
                {"no bus of an effect", "inputs\noutputs\n", 2, 2},
                {"no bus of a synth", "subcategories \"Fx|EQ| Synth\"\ninputs\noutputs\n", 0, 2},
                {"negative counts", "inputs -5 2\noutputs -2147483648\n", 2, 0},
                {"a sum that is too large", "inputs 2147483647 2147483647 2\n", 2147483647, 2},
                {"wrong numbers of buses", "stated-inputs 2147483647\nstated-outputs -2147483648\n", 2, 0},
                {"buses that tell nothing", "inputs 6\noutputs 6\nanswer bus-info internal-error\n", 2, 2}};
    for (const auto &row : rows) {
        const ProbeOutcome outcome = probe(row.name, QByteArray("class A\n") + row.script);
        ASSERT_EQ(outcome.records.size(), 1u) << row.name;
        EXPECT_EQ(outcome.records[0].inputs, row.inputs) << row.name;
        EXPECT_EQ(outcome.records[0].outputs, row.outputs) << row.name;
    }
}

TEST_F(VST3ProbeTest, CallsComeInThisOrder)
{
    const struct {
        const char *name, *script, *entry, *exit, *information;
        VST3Fixture fixture;
    } rows[] = {
        {"oldest factory", "generation 1\n", "module-entry; ", "; module-exit", "", VST3Fixture::Scripted},
        {"older factory", "generation 2\n", "module-entry; ", "; module-exit", "class-info2 %1; ",
         VST3Fixture::Scripted},
        {"no entry and exit", "", "", "", "class-info2 %1; class-info-unicode %1; ", VST3Fixture::Plain}};
    for (const auto &row : rows) {
        probe(row.name, QByteArray("class A\nclass B\nclass A\n") + row.script, row.fixture);
        const QString ofClass =
            QLatin1String("class-info %1; ") + row.information +
            "create-instance %1; initialize %1; bus-count %1: input; bus-info %1: input 0; "
            "bus-count %1: output; bus-info %1: output 0; terminate %1; release %1; ";
        EXPECT_EQ(takeTrace(), QLatin1String("static-constructor; ") + row.entry +
                                   "get-factory; factory-info; count-classes; " + ofClass.arg("A") +
                                   ofClass.arg("B") + "class-info A; factory-release" + row.exit +
                                   "; static-destructor");
    }
}
