#include "Main/AudioEngineController/Effects/VST/VSTProbe.h"

#include "Tests/Main/AudioEngineController/Effects/VST/VSTInstanceBench.h"

namespace {

/// Notes what it hears, a word or two for each.
struct Listener final : IProbeObserver {
    void stageEntered(ProbeStage stage) override
    {
        const char *const names[] = {"load", "start", "ask", "close"};
        heard << names[static_cast<int>(stage)];
    }
    void classBegins(const QString &) override { heard << "class"; }
    void classAnnounced() override { heard << "announced"; }
    void childrenFound(std::size_t count) override { heard << QString::number(count); }
    void childBegins(const EffectRecord &child) override { heard << '<' + child.subName; }
    void childEnds(const ProbeOutcome &outcome) override
    {
        EXPECT_EQ(outcome.records.size(), 1u);
        EXPECT_EQ(outcome.records[0].working, outcome.status == ProbeStatus::Listed);
        heard << '>' + outcome.reason;
    }
    void childCloses(const EffectRecord &child) override { heard << '(' + child.subName; }
    void childClosed() override { heard << ")"; }

    QStringList heard;
};

class VSTProbeTest : public VSTInstanceBench {
protected:
    ProbeOutcome probe(const QByteArray &script, const char *name = "Comp", std::set<quint32> leftOut = {})
    {
        const auto fixture = QString(name) == "NoEntry" ? VST2Fixture::NoEntry : VST2Fixture::Scripted;
        ProbeJob job;
        job.path = script.isNull() ? m_folder.path(name)
                                   : addVST2File(m_folder.plugins(), name, tracing() + script, fixture);
        job.fileTime = "2022-01-02 03:04";
        job.leftOut = std::move(leftOut);
        m_listener.heard.clear();
        return VSTProbe().run(job, m_listener);
    }

    Listener m_listener;
};

} // namespace

TEST_F(VSTProbeTest, OutcomesAreToldApart)
{
    const char *const whole = "load start ask close";
    const char *const noEffect = "its entry point returned something that is not a VST 2 effect";
    const char *const foreign = "its entry point threw something that is not a standard exception";
    const char *const fault = "it crashed when it was started (invalid memory access)";
    const auto listed = ProbeStatus::Listed, failed = ProbeStatus::Failed;
    const struct {
        const char *name;
        QByteArray script; // null: no such file
        ProbeStatus status;
        ProbeStage stage;
        const char *reason, *heard;
        bool hasFaulted = false, leftThreads = false;
    } rows[] = {
        {"good", "", listed, ProbeStage::Close, "", whole},
        {"NoEntry", "", ProbeStatus::NoPlugin, ProbeStage::Load, "it exports no VST 2 entry point", ""},
        {"missing", {}, failed, ProbeStage::Load, "it cannot be opened: ", ""},
        {"null", "answer entry null", failed, ProbeStage::Start, "its entry point returned null",
         "load start close"},
        {"wrong magic", "magic 1", failed, ProbeStage::Start, noEffect, "load start close"},
        {"no memory", "answer entry no-memory", failed, ProbeStage::Start, noEffect, "load start close"},
        {"entry throws", "fault entry throw-int", failed, ProbeStage::Start, foreign, "load start close"},
        {"entry faults", "fault entry segv", failed, ProbeStage::Start, fault, "load start close", true},
        {"call throws", "fault get-vendor-string throw-std", listed, ProbeStage::Close, "", whole},
        {"call faults", "fault get-vendor-string segv", listed, ProbeStage::Close, "", whole, true},
        {"close faults", "fault close segv", listed, ProbeStage::Close, "", whole, true},
        {"thread", "effect entry thread", listed, ProbeStage::Close, "", whole, false, true},
        {"childless", "category 10", failed, ProbeStage::Ask, "it is a shell and lists no sub-plug-ins",
         whole}};
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        const ProbeOutcome outcome = probe(row.script, row.name);
        EXPECT_EQ(outcome.status, row.status);
        EXPECT_EQ(outcome.stage, row.stage);
        EXPECT_TRUE(outcome.reason.contains(row.reason)) << qPrintable(outcome.reason);
        EXPECT_EQ(outcome.reason.isEmpty(), row.status == ProbeStatus::Listed);
        EXPECT_EQ(m_listener.heard.join(' '), row.heard);
        EXPECT_EQ(outcome.records.size(), row.status == ProbeStatus::Listed ? 1u : 0u);
        EXPECT_EQ(outcome.faulted, row.hasFaulted);
        EXPECT_EQ(outcome.leftThreads, row.leftThreads);
        EXPECT_GT(outcome.milliseconds, 0);
        EXPECT_FALSE(m_log.contains("VSTPlugin::Load")) << "that is said of known plug-ins";
    }
}

TEST_F(VSTProbeTest, SubPluginsFailAndAreLeftOutOneByOne)
{
    const ProbeOutcome outcome =
        probe("child 11 A\nchild 12 B\nchild 13 C\nchild 14 D\nchild 15 E\nanswer entry null B\n"
              "fault entry throw-std D\n",
              "Shell", {13});
    EXPECT_EQ(m_listener.heard.join(' '),
              "load start ask 5 <A start ask > <B start >its entry point returned null "
              "<D start close (A ) >its entry point threw: thrown by the fixture "
              "<E load start ask > close (E )")
        << "what throws is unloaded";
    EXPECT_EQ(m_log.count("VSTPlugin::Load - Failed to Load DLL: "), 2);
    QStringList records;
    for (const EffectRecord &record : outcome.records)
        records
            << QStringLiteral("%1 %2 %3 %4").arg(record.subId).arg(record.name, record.subName, record.id) +
                   (record.enabled ? "" : " off") + (record.working ? "" : " broken");
    EXPECT_EQ(records, QStringList({"11 A A A:11", "12 B B  broken", "13 C C  off broken", "14 D D  broken",
                                    "15 E E E:15"}));
    EXPECT_EQ(outcome.records.back().fileTime, "2022-01-02 03:04");
    EXPECT_TRUE(outcome.status == ProbeStatus::Listed && outcome.reason.isEmpty());
}

TEST_F(VSTProbeTest, WhoIsAskedForItsName)
{
    const struct {
        const char *file, *script, *expected;
    } rows[] = {{"My Synth.x64", "name Told\ncategory 2", "My Synth"}, // an instrument with inputs
                {"Caf\xC3\xA9", "name Told\ninputs 0", "Caf\xC3\xA9"},
                {"Comp", "name Told\ninputs -1", "Told"},
                {"Shell", "child 11 Told\ninputs 0", "Told"},
                {"Shell", "child -2 Told\ncategory 2", "Told"},
                {"Comp.64.x", "name \"\"\nanswer get-effect-name 0", "Comp"},
                {"Comp", "name \"\"", ""},
                {"Comp", "name Told\nanswer get-effect-name 0", "Told"},
                {".Comp", "inputs 0", ""}};
    for (const auto &row : rows) {
        const ProbeOutcome outcome = probe(row.script, row.file);
        ASSERT_EQ(outcome.records.size(), 1u) << row.script;
        EXPECT_EQ(outcome.records[0].name, row.expected) << row.script;
    }
    const QString name(1024, 'n'), vendor(256, 'v');
    const EffectRecord read = probe(("name " + name + "\nvendor " + vendor).toUtf8()).records.at(0);
    EXPECT_TRUE(read.name == name && read.vendor == vendor) << "texts end at the buffer";
    EXPECT_EQ(read.id, name.left(255)) << "the key is cut";
}
