#include "Main/AudioEngineController/Effects/VST3/VST3Probe.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST3Fixture.h"

#include <QRegularExpression>
#include <QtEndian>

#include <gtest/gtest.h>

namespace {

const QStringList kStages = {"load", "start", "ask", "close"};

/// Writes down what it hears: stages, classes that begin, and "!" for each that is announced.
class NotingObserver : public IProbeObserver {
public:
    void stageEntered(ProbeStage stage) override { heard << kStages.at(static_cast<int>(stage)); }
    void classBegins(const QString &name) override { heard << name; }
    void classAnnounced() override { heard << "!"; }
    void childrenFound(std::size_t) override {}
    void childBegins(const EffectRecord &) override {}
    void childEnds(const ProbeOutcome &) override {}
    void childCloses(const EffectRecord &) override {}
    void childClosed() override {}

    QStringList heard;
};

class VST3ProbeTest : public testing::Test {
protected:
    /// Probes a module of that name and script.
    ProbeOutcome probe(const QString &name, const QByteArray &script,
                       VST3Fixture fixture = VST3Fixture::Scripted)
    {
        return probe(addVST3File(m_folder.plugins(), name, script, fixture));
    }
    ProbeOutcome probe(const QString &path)
    {
        m_observer.heard.clear();
        return m_probe.run({PluginFormat::Vst3, path, "its time", {}, false}, m_observer);
    }

    const TestFolder m_folder;
    NotingObserver m_observer;
    VST3Probe m_probe;
};

} // namespace

TEST_F(VST3ProbeTest, OutcomesAndWhatTheObserverHears)
{
    const QRegularExpression isEarlier("^(load|start|ask)$");
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
        const ProbeOutcome outcome = probe(row.name, row.script + '\n', row.fixture);
        EXPECT_EQ(m_observer.heard.join(' '), row.heard) << row.name;
        QStringList listed;
        for (const EffectRecord &record : outcome.records) {
            listed << record.name;
            EXPECT_EQ(record.path + record.fileTime, m_folder.plugins() + '/' + row.name + ".vst3its time");
        }
        EXPECT_EQ(outcome.status, listed.isEmpty() ? ProbeStatus::Failed : ProbeStatus::Listed) << row.name;
        if (listed.isEmpty())
            listed << QStringList{"record", "keep"}.at(static_cast<int>(outcome.ifFailed));
        EXPECT_EQ(kStages.at(static_cast<int>(outcome.stage)),
                  outcome.reason.isEmpty() ? "close" : m_observer.heard.filter(isEarlier).last())
            << row.name;
        EXPECT_EQ(listed.join(' ') + (outcome.leftThreads ? " left threads: " : ": ") + outcome.reason,
                  row.outcome);
    }
}

TEST_F(VST3ProbeTest, AClassIsWhatTheFormsSayThatAreAnswered)
{
    // In the older forms the bytes E9 are no UTF-8; in UTF-16 they are a letter.
    const QByteArray described = "class \"A\xE9\"\nvendor \"V\xE9\"\nsubcategories Fx|EQ\n";
    const QByteArray refused[] = {"answer class-info false\n", "answer class-info2 false\n",
                                  "answer class-info-unicode false\n"};
    const struct {
        int answered; // 1, 2 and 4: the forms by their age
        const char *record, *last = "";
    } rows[] = {{7, "A\uFFFD|V\uFFFD|Fx|EQ"},  {1, "A\uFFFD|Fixture Works|"},
                {2, "A\uFFFD|V\uFFFD|Fx|EQ"},  {4, "A\u00E9|V\u00E9|Fx|EQ"},
                {5, "A\uFFFD|Fixture Works|"}, {6, "A\u00E9|V\u00E9|Fx|EQ"},
                {6, "", "category Audio"},     {2, "A\uFFFD|V\uFFFD|Fx|EQ", "generation 2"},
                {4, "", "generation 2"},       {0, ""}};
    for (const auto &row : rows) {
        QByteArray script = described + row.last + '\n';
        for (int form = 0; form < 3; ++form)
            script += (row.answered >> form & 1) != 0 ? QByteArray() : refused[form];
        QStringList found;
        for (const EffectRecord &record : probe("Forms", script).records)
            found << record.name + '|' + record.vendor + '|' + record.categories;
        EXPECT_EQ(found.join(' '), QString::fromUtf8(row.record)) << script.constData();
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
    const ProbeOutcome outcome = probe(m_folder.path("arm.vst3"));
    EXPECT_EQ(m_observer.heard, QStringList());
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
                {"no bus of a synth", "subcategories Fx|Synth\ninputs\noutputs\n", 0, 2},
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
        m_folder.write("trace", {});
        probe(row.name, "trace \"" + m_folder.path("trace").toUtf8() + "\"\nclass A\nclass B\n" + row.script,
              row.fixture);
        const QString ofClass =
            QLatin1String("class-info %1; ") + row.information +
            "create-instance %1; initialize %1; bus-count %1: input; bus-info %1: input 0; "
            "bus-count %1: output; bus-info %1: output 0; terminate %1; release %1; ";
        EXPECT_EQ(m_folder.lines("trace").join("; "),
                  QLatin1String("static-constructor; ") + row.entry +
                      "get-factory; factory-info; count-classes; " + ofClass.arg("A") + ofClass.arg("B") +
                      "factory-release" + row.exit + "; static-destructor");
    }
}
