#include "Tests/Support/PlatformValues.h"
#include "Tests/Workstation/FxScanBench.h"

#include <QDeadlineTimer>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStandardPaths>
#include <QThread>

namespace {

using FxScan = FxScanBench;

} // namespace

TEST_F(FxScan, EveryGoodOneIsListedAndEveryBadOneNamedWithItsReason)
{
    const struct {
        const char *name;
        bool isVst3;
        const char *script;
        const char *state;
        const char *reason; ///< a part of it
    } rows[] = {
        {"Good3", true, "", "ok", "(none)"},
        {"Good2", false, "", "ok", "(none)"},
        {"Crash3", true, "fault initialize abort\n", "disabled", "while it was asked for its data"},
        {"Crash2", false, "fault entry abort\n", "disabled", "when it was started"},
        {"Close2", false, "fault static-destructor abort\n", "disabled",
         "while it was being closed and unloaded"},
        {"Exit3", true, "fault module-entry _exit\n", "disabled", "exit code 0 when it was started"},
        {"Hang2", false, "fault get-vendor-string hang\n", "disabled",
         "no answer for 2 s while it was asked for its data"},
        {"Null2", false, "answer entry null\n", "failed", "its entry point returned null"},
        {"Throw2", false, "fault entry throw-std\n", "failed", "thrown by the fixture"},
        {"Refuse3", true, "answer initialize false\n", "failed", "could not be initialised (result 0x"},
        {"Start3", true, "answer module-entry false\n", "failed", "could not start"},
        {"Factory3", true, "answer get-factory null\n", "", "GetPluginFactory returned null"},
    };
    for (const auto &row : rows)
        put(QString(row.name) + (row.isVst3 ? ".vst3" : ".vst2"), row.script);
    m_folder.write("Plugins/Empty3.vst3", ""); // looked at in each scan
    const auto check = [&rows](const QJsonObject &result) {
        for (const auto &row : rows) {
            SCOPED_TRACE(row.name);
            const QString name = QString(row.name) + (*row.state ? "" : ".vst3"); // no record: the file's
            EXPECT_EQ(states(result)[row.name], row.state);
            EXPECT_TRUE(reason(result, name).contains(row.reason)) << qPrintable(reason(result, name));
        }
    };
    const QJsonObject first = scan({"--timeout", "2"});
    check(first);
    EXPECT_EQ(m_folder.read(m_folder.scanList()).replace("\r\n", "\n"),
              "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<Scan>\n\t<Path>" + m_folder.plugins().toUtf8() +
                  "</Path>\n</Scan>\n");
    EXPECT_EQ(reason(first, "Empty3"), "it is empty");
    EXPECT_TRUE(first["scan"]["finished"].toBool());
    EXPECT_GT(first["scan"]["slowest"][0]["milliseconds"].toDouble(), 0);

    const QByteArray csv = run({"--list", "--format", "csv"}).standardOutput;
    EXPECT_EQ(csv.count("\r\n"), 2 + static_cast<int>(states(first).size()))
        << "the titles, and Factory3: " << csv.constData();
    // The same again: nothing to do but what has no record, and the reasons are still known.
    const QJsonObject second = scan({"--strict"}, 1);
    check(second);
    EXPECT_EQ(number(second, "unchanged"), number(first, "new"));
    EXPECT_EQ(number(second, "new") + number(second, "updated"), 0);
    EXPECT_EQ(trace().filter("initialize"), QStringList());
}

TEST_F(FxScan, ARetryAsksWhatItNamesOrAll)
{
    put("Crash.vst3", "fault initialize abort\n");
    put("Other.vst3", "fault initialize abort\n");
    const QByteArray children = "child 1 One\nchild 2 Two\nchild 3 Three\n";
    put("Shell.vst2", children + "fault entry abort Two\nfault entry abort Three\n");
    scan();
    put("Crash.vst3");
    put("Shell.vst2", children);
    EXPECT_EQ(
        states(scan({"--retry", "crash", "--retry", "Two"})),
        (States{
            {"Crash", "ok"}, {"Other", "disabled"}, {"One", "ok"}, {"Two", "ok"}, {"Three", "disabled"}}));
    const QByteArray before = m_folder.catalogue();
    EXPECT_EQ(run({"--retry", "Other", "--retry", "One"}).exitCode, 2) << "One works";
    EXPECT_EQ(m_folder.catalogue(), before) << "nothing is changed then";
    put("Other.vst3");
    EXPECT_EQ(run({"--retry-failed"}).exitCode, 0) << "in the folders of the last scan";
    EXPECT_EQ(states(scan())["Other"], "ok");
}

TEST_F(FxScan, WhatFailsAfterAnUpdateIsNeitherNewNorGone)
{
    put("Pair.vst3", "class A\nclass B\n");
    const QString gone = put("Gone.vst3");
    EXPECT_EQ(number(scan(), "new"), 3);
    dateLater(put("Pair.vst3", "class A\nclass B\nfault initialize _exit\n"));
    QFile::remove(gone);
    const QJsonObject result = scan();
    EXPECT_EQ(number(result, "new"), 0);
    EXPECT_EQ(number(result, "updated"), 2);
    EXPECT_EQ(result["scan"]["removed"].toArray(), QJsonArray({"Gone"}));
    EXPECT_EQ(states(result), (States{{"A", "disabled"}, {"B", "disabled"}}))
        << "no class of the file is loaded any more";
}

TEST_F(FxScan, MoreKillersThanOneLaunchHasRunsWhateverTheirNames)
{
    QStringList names(std::begin(kNamesLikeMarkup), std::end(kNamesLikeMarkup));
    for (int number = 0; number < 12; ++number)
        names.append("K" + QString::number(number));
    for (const QString &name : names)
        put(name + ".vst3", "class X\nfault initialize _exit\n");
    put("Last.vst3");
    const QJsonObject result = scan();
    EXPECT_EQ(states(result)["Last"], "ok");
    EXPECT_EQ(result["failures"].toArray().size(), names.size());
    EXPECT_TRUE(m_folder.markers().isEmpty());
}

TEST_F(FxScan, ALiveScannersMarkerBlamesNobody)
{
    put("Slow.vst3", "fault initialize hang\n");
    ScannerRun other(scannerProgram(), m_folder);
    ASSERT_TRUE(other.start() && waitForStage(other, "Slow", "initialize"));
    for (const QStringList &options :
         {QStringList{m_folder.plugins(), "--retry-failed"}, {"--favourite", "Slow"}}) {
        const ScannerOutcome outcome = run(options);
        EXPECT_EQ(outcome.exitCode, 3);
        EXPECT_TRUE(outcome.standardError.contains("another scan is at work"))
            << outcome.standardError.constData();
    }
    EXPECT_EQ(m_folder.markers(), QStringList("Slow.scan3"));
    EXPECT_FALSE(m_folder.catalogue().contains("Slow"));
}

TEST_F(FxScan, TheLimitAndTheResultHoldWhateverAPluginPrints)
{
    put("Noise.vst3", "effect initialize print 200000\nfault initialize hang\n");
    EXPECT_EQ(states(scan({"--timeout", "1"}))["Noise"], "disabled");
    put("Chatty.vst3", "effect initialize print 1\n");
    EXPECT_EQ(states(scan({"--in-process"}))["Chatty"], "ok");
}

TEST_F(FxScan, TerminationEndsItCleanly)
{
    ASSERT_TRUE(startHanging("fault initialize hang\n"));
    m_fxscan.requestTermination();
    EXPECT_EQ(m_fxscan.wait().exitCode, 3);
    EXPECT_TRUE(m_folder.markers().isEmpty()) << qPrintable(m_folder.markers().join(' '));
    EXPECT_TRUE(m_folder.catalogue().contains("<Name>Earlier<"));
    EXPECT_FALSE(m_folder.catalogue().contains("<Name>Hang<"));
}

TEST_F(FxScan, NoScannerOutlivesItWhateverItsPluginHandles)
{
    ASSERT_TRUE(startHanging("effect initialize signal term\nfault initialize hang\n"));
    m_fxscan.kill();
    m_fxscan.wait();
    QDeadlineTimer patience(20000);
    while (!m_folder.markers().isEmpty() && !patience.hasExpired())
        QThread::msleep(50);
    EXPECT_TRUE(m_folder.markers().isEmpty()) << "nobody is blamed";
    put("Hang.vst3");
    EXPECT_EQ(states(scan()), (States{{"Earlier", "ok"}, {"Hang", "ok"}}));
}

TEST_F(FxScan, AScannerThatIsMissingOrCannotStartIsSaidAtOnce)
{
    const QFileInfo program(QStringLiteral(FXPROBE_FXSCAN));
    ASSERT_TRUE(QFile::copy(program.filePath(), m_folder.path(program.fileName())));
    put("Comp.vst3");
    ScannerRun fxscan(m_folder.path(program.fileName()), m_folder);
    prepare(fxscan, {m_folder.plugins()});
    EXPECT_TRUE(fxscan.run().exitCode == 3 && trace().isEmpty()) << "no plug-in gets into it unasked";
    EXPECT_TRUE(fxscan.run().standardError.contains("there is no scanner program"));
    m_folder.write(program.fileName().replace("fxscan", "FxProbe"), "not a program");
    const ScannerOutcome &outcome = fxscan.run();
    EXPECT_EQ(outcome.exitCode, 3);
    EXPECT_TRUE(outcome.standardError.contains("FxProbe")) << outcome.standardError.constData();
}

TEST_F(FxScan, JsonLinesComeWhileTheScanGoesOn)
{
    const auto lineOf = [](const QByteArray &text) { return QJsonDocument::fromJson(text).object(); };
    const QStringList asked{"--format", "jsonl"};
    ASSERT_TRUE(startHanging("fault initialize hang\n", asked));
    EXPECT_TRUE(m_fxscan.waitUntil([this] { return m_fxscan.printed().contains("Earlier.vst3"); }));
    m_fxscan.requestTermination();
    const QByteArray cancelled = m_fxscan.wait().standardOutput;
    keepJson(asked, cancelled);
    const QJsonObject summary = lineOf(cancelled.trimmed().split('\n').last());
    EXPECT_EQ(summary["type"], "summary") << cancelled.constData();
    EXPECT_EQ(summary["scan"]["finished"], false);

    put("Hang.vst3", "answer initialize false\n");
    put("Shell.vst2", "child 1 One\nchild 2 Two\nfault entry throw-std Two\n");
    m_folder.write("Plugins/Text.vst3", "not a library");
    for (const QStringList &how : {QStringList{}, QStringList{"--in-process"}}) {
        QDir(m_folder.effects()).removeRecursively();
        States statuses; // of files, and of sub-plug-ins
        const QStringList options = asked + how + QStringList{m_folder.plugins()};
        for (const QByteArray &text : run(options).standardOutput.trimmed().split('\n'))
            if (const QJsonObject line = lineOf(text); line["type"] == "probe")
                statuses[line["subName"].toString(QFileInfo(line["path"].toString()).baseName())] =
                    line["status"].toString();
        EXPECT_EQ(statuses, (States{{"Earlier", "listed"},
                                    {"Hang", "failed"},
                                    {"One", "listed"},
                                    {"Shell", "listed"},
                                    {"Text", "no plug-in"},
                                    {"Two", "failed"}}));
    }
    const QByteArray failed =
        run(asked + QStringList{"--rescan-all", "--only", "failed", m_folder.plugins()}).standardOutput;
    EXPECT_EQ(failed.count(R"("type":"probe")"), 2) << failed.constData();
}

TEST_F(FxScan, TheReasonOfAnEarlierFileIsNotThatOfItsUpdate)
{
    put("Comp.vst3", "answer initialize false\n");
    EXPECT_TRUE(reason(scan(), "Comp").contains("could not be initialised"));
    dateLater(put("Comp.vst3", "answer module-entry false\n"));
    EXPECT_TRUE(scanOnce().succeeded()); // without fxscan, which would note it
    const QByteArray listed = run({"--list", "--format", "json"}).standardOutput;
    EXPECT_FALSE(reason(QJsonDocument::fromJson(listed).object(), "Comp").contains("initialised"))
        << listed.constData();
}

TEST_F(FxScan, EachClassAndChildHasTheLimitForItself)
{
    put("Slow.vst3", "class A\nclass B\nclass C\ndelay initialize 900\n");
    put("Shell.vst2", "child 1 One\nchild 2 Two\nchild 3 Three\ndelay entry 900\n");
    for (const auto &[name, state] : states(scan({"--timeout", "2"})))
        EXPECT_EQ(state, "ok") << qPrintable(name);
}

TEST_F(FxScan, ListingTouchesNothing)
{
    put("Comp.vst3");
    scan();
    m_folder.write("Effects/Comp.scan3", "<CrashedPlugin>");
    const ScannerOutcome listed = run({"--list"});
    EXPECT_TRUE(listed.succeeded());
    EXPECT_TRUE(listed.standardOutput.contains("VST 3   Comp  Fixture Works"))
        << listed.standardOutput.constData();
    EXPECT_EQ(m_folder.markers(), QStringList("Comp.scan3"));
    EXPECT_EQ(trace(), QStringList());
}

TEST_F(FxScan, NamesThatBreakTheCatalogueAreNamed)
{
    put("Bad.vst3", "class \"A < B\"\nvendor \"C & D\"\n");
    const QJsonObject result = scan();
    const QByteArray problems = QJsonDocument(result["problems"].toArray()).toJson();
    EXPECT_TRUE(problems.contains("the name of 'A < B'")) << problems.constData();
    EXPECT_EQ(states(result).size(), 1u) << "shown all the same";
}

TEST_F(FxScan, OnATerminalTheResultBeginsALine)
{
    const QString script = QStandardPaths::findExecutable("script");
    if (script.isEmpty())
        GTEST_SKIP() << "there is no program that makes a terminal";
    put("Comp.vst3", "delay initialize 300\n");
    ScannerRun terminal(script, m_folder);
    terminal.removeEnvironment("FXPROBE_LOG");
    const QStringList words{FXPROBE_FXSCAN, "--data-folder", m_folder.dataFolder(), m_folder.plugins()};
    terminal.setArguments({"-qec", words.join(' '), "/dev/null"});
    const QByteArray output = terminal.run().standardOutput;
    EXPECT_TRUE(output.contains("[0/1] VST 3  Comp.vst3")) << output.constData();
    EXPECT_TRUE(output.contains("\r\x1b[KFORMAT")) << output.constData();
}

TEST_F(FxScan, WrongUsage)
{
    const QString nowhere = m_folder.path("nowhere");
    const struct {
        QStringList options;
        const char *message;
    } rows[] = {
        {{"--no-such-option"}, "no-such-option"},
        {{"--timeout", "-1"}, "--timeout must be 0 to 86400 seconds, not '-1'"},
        {{nowhere}, "there is no folder"},
        {{"--list", "--data-folder", nowhere}, "nothing was scanned into"},
        {{m_folder.plugins(), "--retry", "Nobody"}, "no disabled or failed plug-in is named 'Nobody'"},
    };
    for (const auto &row : rows) {
        const ScannerOutcome outcome = run(row.options);
        EXPECT_EQ(outcome.exitCode, 2) << row.message;
        EXPECT_TRUE(outcome.standardError.contains(row.message)) << outcome.standardError.constData();
        EXPECT_TRUE(outcome.standardOutput.isEmpty()) << outcome.standardOutput.constData();
    }
    EXPECT_TRUE(run({"--help"}).standardOutput.contains("--retry-failed"));
}
