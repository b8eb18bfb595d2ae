#include "Core/BaseLib/Files/NativeFile.h"
#include "Tests/Support/PlatformValues.h"
#include "Tests/Workstation/FxScanBench.h"

#include <QFile>
#include <QRegularExpression>

namespace {

/// What users look up.
class Looking : public FxScanBench {
protected:
    static QStringList namesIn(const QJsonValue &list)
    {
        QStringList names;
        for (const QJsonValue each : list.toArray())
            names << each["name"].toString();
        return names;
    }
};

} // namespace

TEST_F(Looking, OnlyWhatIsAskedForIsShownInEveryForm)
{
    put("Synth.vst3", "class Synth\nsubcategories Instrument|Synth\nvendor \"Keys & Co\"\n");
    put("Old.vst2", "name Old\ncategory 2\n");
    put("Comp.vst3");
    put("Crash.vst3", "fault initialize abort\n");
    put("Null.vst2", "answer entry null\n");
    put("Bare.vst3", "answer get-factory null\n"); // has no record
    scan();
    const struct {
        const char *words;
        const char *plugins;
        const char *failures;
    } rows[] = {
        {"ok", "Comp Old Synth", ""},
        {"failed", "Null", "Null Bare.vst3"},
        {"failed disabled", "Crash Null", "Crash Null Bare.vst3"},
        {"vst2", "Null Old", "Null"},
        {"vst3 failed", "", "Bare.vst3"},
        {"instrument", "Old Synth", ""},
        {"instrument vst3 ok", "Synth", ""},
        {"vendor=keys", "Synth", ""},
        {"vendor=keys vendor=fixture vst3", "Comp Synth", ""},
        {"category=instrument", "Synth", ""},
        {"favourite", "", ""},
    };
    for (const auto &row : rows) {
        QStringList options;
        for (const QString &word : QString(row.words).split(' '))
            options += {"--only", word};
        const QJsonObject result = scan(options); // Bare is asked at each
        EXPECT_EQ(namesIn(result["plugins"]).join(' '), row.plugins) << row.words;
        EXPECT_EQ(namesIn(result["failures"]).join(' '), row.failures) << row.words;
        options += "--list";
        const QByteArray csv = run(options + QStringList{"--format", "csv"}).standardOutput;
        const int bare = namesIn(result["failures"]).count("Bare.vst3");
        EXPECT_EQ(csv.count("\r\n") - 1, namesIn(result["plugins"]).size() + bare) << csv.constData();
    }
    EXPECT_TRUE(
        run({"--list", "--only", "vst2"}).standardOutput.endsWith("\n2 of 6 plug-ins: 1 usable, 1 failed\n"));
    EXPECT_TRUE(run({"--quiet", "--only", "failed", m_folder.plugins()})
                    .standardOutput.contains("\n2 of 6 plug-ins: 2 failed"));
    EXPECT_EQ(run({"--list", "--only", "ok", "--strict"}).exitCode, 1)
        << "what is shown changes nothing else";
    EXPECT_EQ(run({"--list", "--only", "vendor="}).exitCode, 2);
}

TEST_F(Looking, WhatCannotBeUsedSaysHowToTryAgain)
{
    put("Same.vst3", "fault initialize abort\n");
    put("It's new.vst3", "fault initialize abort\n");
    put("a/Twin.vst3", "fault initialize abort\n");
    const QString twin = put("b/Twin.vst3", "fault initialize abort\n");
    put("Pair.vst3", "class A\nclass B\n");
    scan();
    dateLater(put("It's new.vst3"));
    dateLater(put("b/Twin.vst3"));
    dateLater(put("Pair.vst3", "class A\nclass B\nfault initialize _exit\n"));
    const QByteArray shown = run({m_folder.plugins()}).standardOutput;
    const QByteArray hint = "changed since it crashed: fxscan --retry ";
    EXPECT_EQ(shown.count(hint), 2) << shown.constData();
    EXPECT_TRUE(
        shown.contains(hint + (kPathCase == Qt::CaseSensitive ? "'It'\\''s new'\n" : "\"It's new\"\n")));
    EXPECT_TRUE(shown.contains(hint + twin.toUtf8() + '\n')) << "another one has its name";
    EXPECT_TRUE(shown.contains("  A, B (VST 3, disabled): it ended its process with exit code 0")) << "once";
    EXPECT_TRUE(shown.contains("To try again: fxscan --retry NAME")) << shown.constData();
    EXPECT_FALSE(run({"--list", "--only", "ok"}).standardOutput.contains("To try again"));
}

TEST_F(Looking, EverythingIsToldOfOnePlugin)
{
    put("Comp.vst3", "class Comp\nsubcategories Fx|Dynamics\n");
    const QString copy = put("later/Comp.vst3", "class Comp\n");
    put("Shell.vst2", "child 1 One\nchild 2 Two\nfault entry abort Two\n");
    put("Crash.vst3", "fault initialize call-null\n");
    put("Null.vst2", "answer entry null\n");
    put("Bare.vst3", "answer get-factory null\n");
    m_folder.write("Plugins/Empty.vst3", {}); // looked at again at each scan
    scan();
    EXPECT_FALSE(run({"--list"}).standardOutput.contains("Problem")) << "also not of a shell";
    const struct {
        QString name;
        int exitCode;
        QStringList says; ///< regular expressions
    } rows[] = {
        {"comp",
         0,
         {"^Comp\n", "format +VST 3", "categories +Dynamics", "in/out +2/2", "last probe +listed, \\d"}},
        {copy, 0, {"^Comp\n", "not used  VST 3  .*later/Comp.vst3: a copy of "}},
        {"Crash",
         0,
         {"last probe +crashed while it was asked for its data, \\d+\\.\\d ms\n", "reason +it crashed",
          "crashed at(.|\n)*Crash.vst3\\+0x"}},
        {"Two",
         0,
         {"state +disabled", "sub-plug-in +Two \\(2\\)",
          kPathCase == Qt::CaseSensitive
              ? "crashed at(.|\n)*Shell\\.\\w+\\+0x"
              : "with exit code 3 when it was started"}}, // abort() is an exit on Windows
        {"One", 0, {"state +ok", "last probe +listed"}},
        {"Null", 0, {"last probe +failed when it was started", "reason +its entry point returned null"}},
        {"Empty", 0, {"last probe +failed while it was being loaded, .*\n  reason +it is empty\n"}},
        {"Nobody", 2, {"no plug-in is named 'Nobody'"}},
        {"Bare.vst3", 2, {"Bare.vst3: GetPluginFactory returned null"}},
    };
    for (const auto &row : rows) {
        const ScannerOutcome outcome = run({"--show", row.name});
        const QString said = QString::fromUtf8(outcome.standardOutput + outcome.standardError);
        EXPECT_EQ(outcome.exitCode, row.exitCode) << qPrintable(row.name);
        for (const QString &each : row.says)
            EXPECT_TRUE(said.contains(QRegularExpression(each))) << qPrintable(each + "\n" + said);
    }
    EXPECT_TRUE(run({"--list"}).standardOutput.contains("Empty (VST 3, failed): it is empty.\n"));
    EXPECT_FALSE(run({"--show", "One"}).standardOutput.contains("crashed at")) << "its sibling did";
    const QJsonObject shown =
        QJsonDocument::fromJson(run({"--show", "Crash", "--format", "json"}).standardOutput).object();
    EXPECT_EQ(namesIn(shown["plugins"]), QStringList("Crash"));
    EXPECT_EQ(shown["plugins"][0]["probe"]["status"], "crashed");
    EXPECT_FALSE(shown["plugins"][0]["probe"]["frames"].toArray().isEmpty());
}

TEST_F(Looking, WhatIsThereMoreThanOnceSaysWhatIsUsed)
{
    put("a/Comp.vst3", "class Comp\n");
    put("b/Comp.vst3", "class Comp\n"); // a copy
    put("b/Verb.clap", "class Verb\nid same\n");
    put("c/Wah.clap", "class Wah\nid same\n"); // no copy
    put("Delay.vst3");
    put("Delay.vst2");
    put("v1/Gate.vst3", "class Gate\nid 00000000000000000000000000000001\n");
    put("v2/New Gate.vst3", "class Gate\nid 00000000000000000000000000000002\n"); // another version
    put("Echo.vst3", "class Echo\nvendor One\n");
    put("Echo.vst2", "vendor Other\n");
    put("Twice.vst3");
    put("Twice.vst2", "answer entry null\n"); // nobody knows whose it is
    scan();
    run({"--switch-off", m_folder.path("Plugins/v1/Gate.vst3")});
    const QJsonObject result = scan();
    QStringList found;
    for (const QJsonValue each : result["duplicates"].toArray()) {
        QStringList members;
        for (const QJsonValue member : each["members"].toArray())
            members << member["format"].toString() + (member["used"].toBool() ? "+" : "-") +
                           member["path"].toString().mid(m_folder.plugins().size() + 1).section('.', 0, -2) +
                           (member["reason"].isUndefined() ? ""
                                                           : ": " + member["reason"].toString().left(12));
        found << each["name"].toString() + " = " + members.join(", ");
    }
    EXPECT_EQ(found, QStringList({"Comp = vst3+a/Comp, vst3-b/Comp: a copy of " + m_folder.path("").left(2),
                                  "Delay = vst3+Delay, vst2+Delay",
                                  "Gate = vst3+v2/New Gate, vst3-v1/Gate: switched off",
                                  "Verb = clap+b/Verb, clap-c/Wah: Wah, which h"}));
    const QString shown = QString::fromUtf8(run({"--list"}).standardOutput);
    EXPECT_TRUE(shown.contains("\n  Delay (Fixture Works): VST 3, VST 2, all used\n")) << qPrintable(shown);
    EXPECT_TRUE(
        shown.contains("    not used  VST 3  " + m_folder.path("Plugins/v1/Gate.vst3") + ": switched off\n"))
        << qPrintable(shown);
    QFile::remove(m_folder.path("Plugins/b/Comp.vst3"));
    EXPECT_FALSE(run({"--list"}).standardOutput.contains("a copy of")) << "it is gone";
}

TEST_F(Looking, TextsOfPluginsStayInTheirLines)
{
    const QByteArray evil = "\\x1b]0;x\\x0AForged\\xC2\\x9B\\xE2\\x80\\xAE\"\n";
    put("Evil.vst2", "name \"A" + evil + "vendor \"B" + evil);
    put("Evil.clap", "class \"A" + evil + "id \"I" + evil + "vendor \"B" + evil + "features \"C" + evil);
    put("Fails.clap", "class \"D" + evil + "answer init false\n");
    const QString shell =
        put("Shell.vst2", "child 1 \"E" + evil + "child 2 \"F" + evil + "fault entry abort 2\n");
    const QStringList hows[] = {{},
                                {"--in-process"},
                                {"--list"},
                                {"--list", "--format", "html"},
                                {"--show", "Evil.clap", "--show", shell},
                                {"--rescan", m_folder.path("Plugins/Fails.clap"), "--format", "jsonl"},
                                {"--switch-off", "Evil.clap"}};
    for (const QStringList &how : hows) {
        const bool isScan = how.isEmpty() || how.front() == "--in-process" || how.front() == "--rescan";
        const ScannerOutcome &outcome = run(how + (isScan ? QStringList(m_folder.plugins()) : QStringList()));
        const QString text = QString::fromUtf8(outcome.standardOutput + outcome.standardError) +
                             QString::fromUtf8(m_folder.read("FxProbe.log"));
        const QString harmful = how.contains("jsonl") ? "\\x1b|\nForged" : "\\x1b|\\x{9b}|\\x{202e}|\nForged";
        EXPECT_FALSE(text.contains(QRegularExpression(harmful))) << qPrintable(how.join(' ') + '\n' + text);
        EXPECT_TRUE(text.contains("Forged")) << qPrintable(how.join(' '));
    }
}
