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
    // Name, script, reason, what the observer hears, and what else is told.
    const char *const rows = R"(
good ~ ~ ~ load start ask close
NoEntry ~ ~ it exports no VST 2 entry point ~
missing ~ - ~ it cannot be opened: ~ ~
null ~ answer entry null ~ its entry point returned null ~ load start close
wrong magic ~ magic 1 ~ its entry point returned something that is not a VST 2 effect ~ load start close
no memory ~ answer entry no-memory ~ its entry point returned something that is not a VST 2 effect ~ load start close
entry throws ~ fault entry throw-null ~ its entry point threw an exception without a text ~ load start close
entry faults ~ fault entry segv ~ it crashed when it was started (invalid memory access at 0x10 in  ~ load start close ~ faulted
calls nothing ~ fault entry call-null ~ invalid memory access at 0x0, called from calls nothing. ~ load start close ~ faulted
call throws ~ fault get-vendor-string throw-std ~ ~ load start ask close
call faults ~ fault get-vendor-string segv ~ ~ load start ask close ~ faulted
close faults ~ fault close segv ~ ~ load start ask close ~ faulted
thread ~ effect entry thread ~ ~ load start ask close ~ left threads
childless ~ category 10 ~ it is a shell and lists no sub-plug-ins ~ load start ask close
)";
    for (const QStringList &row : rowsOf(rows)) {
        SCOPED_TRACE(row[0].toStdString());
        const ProbeOutcome outcome = probe(row[1] == "-" ? QByteArray() : scriptIn(row[1]), row[0]);
        const bool isListed = row[2].isEmpty(), isNoPlugin = row[0] == "NoEntry";
        EXPECT_EQ(outcome.status, isListed     ? ProbeStatus::Listed
                                  : isNoPlugin ? ProbeStatus::NoPlugin
                                               : ProbeStatus::Failed);
        expectStage(outcome);
        EXPECT_TRUE(outcome.reason.contains(row[2]) && outcome.reason.isEmpty() == isListed)
            << qPrintable(outcome.reason);
        EXPECT_EQ(m_observer.heard.join(' '), row[3]);
        EXPECT_EQ(outcome.records.size(), isListed ? 1u : 0u);
        EXPECT_EQ(outcome.faulted, row.value(4) == "faulted");
        EXPECT_EQ(outcome.leftThreads, row.value(4) == "left threads");
        EXPECT_TRUE(!row[0].startsWith("call ") || m_log.lines().last().contains('/' + row[0] + '.'));
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
    // File, script, record, and the calls.
    const char *const rows = R"(
Main ~ ~ Main:1000 1 2>2+0 ~ category; name; category; vendor
Both ~ ~ Both:1000 1 2>2+0 ~ category; name; category; vendor
Comp ~ name "R\xF6hre" / vendor "\xDFound" / id 77 / category 3 / outputs 6 ~ Röhre:77 3 2>6+0 ßound ~ category; name; category; vendor
My Synth.x64 ~ name Told / category 2 ~ My Synth:1000 2 2>2+0 ~ category; category; vendor
Café ~ inputs 0 / outputs 2147483647 / id -1 ~ Café:-1 2 0>2147483647+0 ~ vendor
Comp ~ name Told / inputs -1 / outputs -5 / latency -7 ~ Told:1000 1 -1>-5+-7 ~ category; name; category; vendor
Comp.64.x ~ name "" / answer get-effect-name 0 ~ Comp:1000 1 2>2+0 ~ category; name; category; vendor
Comp ~ name "" ~ :1000 1 2>2+0 ~ category; name; category; vendor
Comp ~ name Told / answer get-effect-name 0 ~ Told:1000 1 2>2+0 ~ category; name; category; vendor
.Comp ~ inputs 0 ~ :1000 2 0>2+0 ~ vendor
Comp ~ set get-plug-category inputs 0 ~ Comp:1000 2 0>2+0 ~ category; name; vendor
Comp ~ set get-effect-name inputs 0 / set get-effect-name id 77 ~ Comp:77 2 0>2+0 ~ category; name; vendor
Comp ~ set get-vendor-string inputs 0 / set get-vendor-string id 77 ~ Comp:1000 1 0>2+0 ~ category; name; category; vendor
Comp ~ set get-vendor-string outputs 6 / set get-vendor-string latency 64 ~ Comp:1000 1 2>6+64 ~ category; name; category; vendor
Comp ~ inputs 0 / set get-vendor-string inputs 1 ~ Comp:1000 2 1>2+0 ~ vendor
)";
    for (const QStringList &row : rowsOf(rows)) {
        SCOPED_TRACE(row[1].toStdString());
        const ProbeOutcome outcome = probe(scriptIn(row[1]), row[0]);
        ASSERT_EQ(outcome.records.size(), 1u);
        EXPECT_EQ(textOf(outcome.records[0]), row[2]);
        QStringList calls = takeTrace().split("; ").mid(2);
        calls.replaceInStrings(QRegularExpression("^get-(plug-|effect-|)([a-z]+).*"), "\\2");
        EXPECT_EQ(calls.mid(0, calls.size() - 2).join("; "), row[3]);
    }
    for (const char *script : {"child 11 Told\ninputs 0", "child -2 Told\ncategory 2"})
        EXPECT_EQ(probe(script, "Shell").records.at(0).name, "Told") << script;
    const QString name(1024, 'n'), vendor(256, 'v');
    const EffectRecord read = probe(("name " + name + "\nvendor " + vendor).toUtf8()).records.at(0);
    EXPECT_TRUE(read.name == name && read.vendor == vendor) << "texts end at the buffer";
    EXPECT_EQ(read.id, name.left(255)) << "the key is cut";
}
