#include "Main/AudioEngineController/Effects/VST/VSTProbe.h"

#include "Tests/Support/PluginBench.h"
#include "Tests/Support/VST2Fixture.h"

namespace {

class VSTProbeTest : public PluginBench {
protected:
    ProbeOutcome probe(const QByteArray &script, const QString &name = "Comp",
                       const std::set<quint32> &leftOut = {})
    {
        const std::map<QString, VST2Fixture> fixtures = {
            {"NoEntry", VST2Fixture::NoEntry}, {"Main", VST2Fixture::Main}, {"Both", VST2Fixture::Both}};
        const auto fixture = fixtures.find(name);
        const QString path = addVST2File(m_folder.plugins(), name, tracing() + script,
                                         fixture == fixtures.end() ? VST2Fixture::Scripted : fixture->second);
        if (script.isNull())
            QFile::remove(path);
        return PluginBench::probe(VSTProbe(), path, leftOut);
    }
};

/// "NAME:ID CATEGORY INPUTS>OUTPUTS+LATENCY", the vendor where it is not the usual one, and what failed.
QString textOf(const EffectRecord &record)
{
    EXPECT_TRUE(!record.working || record.width == record.outputs) << "the catalogue's width";
    QString text = QStringLiteral("%1 %2 %3>%4+%5")
                       .arg(record.id.isEmpty() ? record.name + '!' : record.id)
                       .arg(record.vstCategory)
                       .arg(record.inputs)
                       .arg(record.outputs)
                       .arg(record.latency);
    if (record.subId != 0)
        text += QStringLiteral(" of %1 %2").arg(record.subId).arg(record.subName);
    return text + (record.enabled ? "" : " off") +
           (record.vendor == "Fixture Works" ? "" : ' ' + record.vendor);
}

} // namespace

TEST_F(VSTProbeTest, OutcomesAreToldApart)
{
    const char *const whole = "load start ask close", *const entered = "load start close";
    const QString noEffect = "its entry point returned something that is not a VST 2 effect";
    const struct {
        const char *name;
        QByteArray script; // null: no such file
        QString reason, heard;
        bool hasFaulted = false, leftThreads = false;
    } rows[] = {{"good", "", "", whole},
                {"NoEntry", "", "it exports no VST 2 entry point", ""},
                {"missing", {}, "it could not be loaded: ", "load"},
                {"null", "answer entry null", "its entry point returned null", entered},
                {"wrong magic", "magic 1", noEffect, entered},
                {"no memory", "answer entry no-memory", noEffect, entered},
                {"entry throws", "fault entry throw-int",
                 "its entry point threw something that is not a standard exception", entered},
                {"entry faults", "fault entry segv", "its entry point failed: SE Exception: Access Violation",
                 entered, true},
                {"call throws", "fault get-vendor-string throw-std", "", whole},
                {"call faults", "fault get-vendor-string segv", "", whole, true},
                {"close faults", "fault close segv", "", whole, true},
                {"thread", "effect entry thread", "", whole, false, true},
                {"childless", "category 10", "it is a shell and lists no sub-plug-ins", whole}};
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        const ProbeOutcome outcome = probe(row.script, row.name);
        const bool isListed = row.reason.isEmpty(), isNoPlugin = row.heard.isEmpty();
        EXPECT_EQ(outcome.status, isListed     ? ProbeStatus::Listed
                                  : isNoPlugin ? ProbeStatus::NoPlugin
                                               : ProbeStatus::Failed);
        expectStage(outcome);
        EXPECT_TRUE(outcome.reason.contains(row.reason) && outcome.reason.isEmpty() == isListed)
            << qPrintable(outcome.reason);
        EXPECT_EQ(m_observer.heard.join(' '), row.heard);
        EXPECT_EQ(outcome.records.size(), isListed ? 1u : 0u);
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
    EXPECT_EQ(m_observer.heard.join(' '),
              "load start ask 5 <A start ask > <B start >its entry point returned null "
              "<D start close (A ) >its entry point threw: thrown by the fixture "
              "<E load start ask > close (E )")
        << "what throws is unloaded";
    EXPECT_EQ(m_log.count("VSTPlugin::Load - Failed to Load DLL: "), 2);
    QStringList records;
    for (const EffectRecord &record : outcome.records)
        records << textOf(record);
    EXPECT_EQ(records,
              QStringList({"A:11 1 2>2+0 of 11 A", "B! 10 -1>-1+0 of 12 B", "C! 10 -1>-1+0 of 13 C off",
                           "D! 10 -1>-1+0 of 14 D", "E:15 1 2>2+0 of 15 E"}));
    EXPECT_EQ(outcome.records.back().fileTime, "its time");
    EXPECT_TRUE(outcome.status == ProbeStatus::Listed && outcome.reason.isEmpty());
    for (const auto &[script, count] : {std::pair("child 1 A\nafter-children endless", 4096u),
                                        std::pair("child 1 A\nchild 2 B\nafter-children repeat", 2u)}) {
        std::set<quint32> all{1, 2};
        for (quint32 id = 1000000; id < 1005000; ++id)
            all.insert(id);
        EXPECT_EQ(probe(script, "Endless", all).records.size(), count) << script;
        EXPECT_TRUE(m_log.lines().last().contains("names more than 4096 sub-plug-ins"));
    }
}

TEST_F(VSTProbeTest, WhatIsAskedAndReadAndWhen)
{
    const char *const all = "get-plug-category; get-effect-name; get-plug-category; get-vendor-string";
    const char *const once = "get-plug-category; get-effect-name; get-vendor-string";
    const struct {
        const char *file, *script, *record, *calls;
    } rows[] = {
        {"Main", "", "Main:1000 1 2>2+0", all},
        {"Both", "", "Both:1000 1 2>2+0", all},
        {"Comp", "name \"R\\xF6hre\"\nvendor \"\\xDFound\"\nid 77\ncategory 3\noutputs 6",
         "R\u00F6hre:77 3 2>6+0 \u00DFound", all},
        {"My Synth.x64", "name Told\ncategory 2", "My Synth:1000 2 2>2+0", // an instrument with inputs
         "get-plug-category; get-plug-category; get-vendor-string"},
        {"Caf\u00E9", "inputs 0\noutputs 2147483647\nid -1", "Caf\u00E9:-1 2 0>2147483647+0",
         "get-vendor-string"},
        {"Comp", "name Told\ninputs -1\noutputs -5\nlatency -7", "Told:1000 1 -1>-5+-7", all},
        {"Comp.64.x", "name \"\"\nanswer get-effect-name 0", "Comp:1000 1 2>2+0", all},
        {"Comp", "name \"\"", ":1000 1 2>2+0", all},
        {"Comp", "name Told\nanswer get-effect-name 0", "Told:1000 1 2>2+0", all},
        {".Comp", "inputs 0", ":1000 2 0>2+0", "get-vendor-string"},
        // What a call changes counts from then on.
        {"Comp", "set get-plug-category inputs 0", "Comp:1000 2 0>2+0", once},
        {"Comp", "set get-effect-name inputs 0\nset get-effect-name id 77", "Comp:77 2 0>2+0", once},
        {"Comp", "set get-vendor-string inputs 0\nset get-vendor-string id 77", "Comp:1000 1 0>2+0", all},
        {"Comp", "set get-vendor-string outputs 6\nset get-vendor-string latency 64", "Comp:1000 1 2>6+64",
         all},
        {"Comp", "inputs 0\nset get-vendor-string inputs 1", "Comp:1000 2 1>2+0", "get-vendor-string"}};
    for (const auto &row : rows) {
        SCOPED_TRACE(row.script);
        const ProbeOutcome outcome = probe(row.script, QString::fromUtf8(row.file));
        ASSERT_EQ(outcome.records.size(), 1u);
        EXPECT_EQ(textOf(outcome.records[0]), QString::fromUtf8(row.record));
        QString trace = takeTrace();
        EXPECT_EQ(trace.remove(QRegularExpression(" (?!clos|stat|entr|get-)[^;]*")).section("; ", 2, -3),
                  row.calls);
    }
    for (const char *script : {"child 11 Told\ninputs 0", "child -2 Told\ncategory 2"})
        EXPECT_EQ(probe(script, "Shell").records.at(0).name, "Told") << script;
    const QString name(1024, 'n'), vendor(256, 'v');
    const EffectRecord read = probe(("name " + name + "\nvendor " + vendor).toUtf8()).records.at(0);
    EXPECT_TRUE(read.name == name && read.vendor == vendor) << "texts end at the buffer";
    EXPECT_EQ(read.id, name.left(255)) << "the key is cut";
}
