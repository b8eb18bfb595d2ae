#include "Core/BaseLib/Files/NativeFile.h"
#include "Tests/Support/PlatformValues.h"
#include "Tests/Workstation/FxScanBench.h"

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
        EXPECT_EQ(csv.count("\r\n") - 1, namesIn(result["plugins"]).size()) << csv.constData();
    }
    EXPECT_TRUE(
        run({"--list", "--only", "vst2"}).standardOutput.endsWith("\n2 of 5 plug-ins: 1 usable, 1 failed\n"));
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
