#include "Tests/Workstation/FxScanBench.h"
#include "Workstation/Options/OptionTable.h"
#include "Workstation/Options/OptionTexts.h"

#include <QProcess>
#include <QStandardPaths>

#include <gtest/gtest.h>

#include <map>

namespace {

using Completion = FxScanBench;

CommandLine read(const QStringList &arguments) { return readCommandLine(QStringList("fxscan") + arguments); }

/// What bash offers for the last of the words.
QStringList completions(const QString &bash, const QStringList &words, const QString &fxscan = "fxscan")
{
    const QString script = bashCompletion() + "COMP_WORDS=(\"$@\"); COMP_CWORD=$(($# - 1)); _fxscan\n"
                                              "printf '%s\\n' \"${COMPREPLY[@]}\"";
    QProcess shell;
    shell.start(bash, QStringList({"--norc", "-c", script, "bash", fxscan}) + words);
    EXPECT_TRUE(shell.waitForFinished());
    return QString::fromUtf8(shell.readAllStandardOutput()).split('\n', Qt::SkipEmptyParts);
}

} // namespace

TEST(Options, GoWhereTheyBelong)
{
    const CommandLine line = read({"--format=json", "--timeout", "0", "--retry", "A", "--retry", "B",
                                   "--quiet", "--data-folder", "/data/../kept", "/plug-ins"});
    ASSERT_FALSE(line.isError) << qPrintable(line.text);
    EXPECT_EQ(line.options.format, OutputFormat::Json);
    EXPECT_EQ(line.options.timeout, 0);
    EXPECT_EQ(line.options.retry, QStringList({"A", "B"}));
    EXPECT_TRUE(line.options.quiet);
    EXPECT_FALSE(line.options.strict);
    EXPECT_TRUE(line.options.dataFolder.endsWith("/kept")) << qPrintable(line.options.dataFolder);
    EXPECT_EQ(line.options.folders, QStringList("/plug-ins"));
}

TEST(Options, WrongOnesAreNamedWithWhatToDo)
{
    const struct {
        QStringList arguments;
        const char *message;
    } rows[] = {
        {{"--format", "xml"}, "unknown format 'xml'; use table, json, jsonl, csv or html"},
        {{"--format", "JSON"}, "unknown format 'JSON'; use table, json, jsonl, csv or html"},
        {{"--timeout", "%1"}, "--timeout must be 0 to 86400 seconds, not '%1'"},
        {{"--timeout", "86401"}, "--timeout must be 0 to 86400 seconds, not '86401'"},
        {{"--retry", "A", "--retry", ""}, "--retry needs a name"},
        {{"--data-folder="}, "--data-folder needs a folder"},
        {{"--quiet=yes"}, "Unexpected value after '--quiet'."},
        {{"--list", "/plug-ins"}, "--list makes no scan; it takes no folders"},
        {{"--folders", "/plug-ins"}, "--folders makes no scan; it takes no folders"},
        {{"--list", "--timeout", "5"}, "--list makes no scan; it cannot be combined with --timeout"},
        {{"--folders", "--format", "json"},
         "--folders prints no plug-ins; it cannot be combined with --format"},
        {{"--timeout", "5", "--in-process"},
         "--in-process cannot end a plug-in that hangs; it cannot be combined with --timeout"},
    };
    for (const auto &row : rows) {
        const CommandLine line = read(row.arguments);
        EXPECT_TRUE(line.isError) << row.message;
        EXPECT_EQ(line.text.toStdString(),
                  std::string("fxscan: ") + row.message + "\nTry 'fxscan --help'.\n");
    }
}

TEST(Options, ConflictsNameOptionsThatExist)
{
    std::map<std::string, const OptionRow *> rows;
    for (const OptionRow &row : optionTable())
        EXPECT_TRUE(rows.emplace(row.name, &row).second) << row.name << " stands twice";
    for (const OptionConflict &conflict : optionConflicts()) {
        EXPECT_EQ(rows.count(conflict.option), 1u) << conflict.option;
        EXPECT_EQ(rows.count(conflict.other), 1u) << conflict.other;
    }
}

TEST(Options, BashCompletesThem)
{
    const QString bash = QStandardPaths::findExecutable("bash");
    if (bash.isEmpty())
        GTEST_SKIP() << "there is no bash on this machine";
    EXPECT_EQ(completions(bash, {"--retry-"}), QStringList({"--retry-changed", "--retry-failed"}));
    EXPECT_EQ(completions(bash, {"--format", ""}), QStringList({"table", "json", "jsonl", "csv", "html"}));
    EXPECT_EQ(completions(bash, {"--timeout", ""}), QStringList());
    EXPECT_EQ(completions(bash, {"--data-folder", "/us"}), QStringList("/usr"));
    EXPECT_TRUE(completions(bash, {"/etc/pass"}).contains("/etc/passwd")) << "a plug-in may be a file";
}

TEST_F(Completion, KnowsThePluginsWhateverTheirNames)
{
    const QString bash = QStandardPaths::findExecutable("bash");
    if (bash.isEmpty())
        GTEST_SKIP() << "there is no bash on this machine";
    put("Plain.vst3", "class Comp\nvendor \"Keys & Co, Ltd\"\n");
    put("Odd.vst3", "class \"$(touch hacked) \\x22a\\x22, *\"\nclass =1\n");
    put("Crash.vst3", "fault initialize abort\n");
    scan();
    const struct {
        const char *words; ///< as bash parts them
        QStringList offered;
    } rows[] = {
        {"--show|", {"$(touch hacked) \"a\", *", "=1", "Comp", "Crash"}},
        {"--show|Co", {"Comp"}},
        {"--show|$\\(tou", {"$(touch hacked) \"a\", *"}},
        {"--show|=|C", {"Comp", "Crash"}},
        {"--retry|", {"Crash"}},
        {"--switch-on|", {}},
        {"--show|/us", {"/usr"}},
        {"--only|fa", {"failed", "favourite"}},
        {"--only|=|", {"ok"}},
        {"--only=ok", {"--only=ok"}}, // where somebody has bash not part words at "="
        {"--only|vendor|=|Ke", {"Keys & Co, Ltd"}},
        {"--only|=|vendor|=", {"Fixture Works", "Keys & Co, Ltd"}},
    };
    for (const auto &row : rows) {
        QStringList words{"--data-folder", "=", m_folder.dataFolder()};
        QStringList offered = completions(bash, words + QString(row.words).split('|'), FXPROBE_FXSCAN);
        offered.removeDuplicates();
        if (row.offered == QStringList("ok"))
            offered = offered.mid(0, 1);
        EXPECT_EQ(offered, row.offered) << row.words;
    }
    EXPECT_EQ(completions(bash, {"--data-folder", m_folder.path("none"), "--show", ""}, FXPROBE_FXSCAN),
              QStringList());
    EXPECT_FALSE(QFile::exists("hacked"));
}

TEST(Options, ManualIsTroff)
{
    const QString manual = manualPage(".SH OPTIONS\n@OPTIONS@\n.SH NEXT\n");
    EXPECT_TRUE(manual.contains("\n.TP\n.BI \\-\\-data\\-folder \" folder\"\nKeep the"))
        << qPrintable(manual);
    EXPECT_TRUE(manual.contains("\n.TP\n.B \\-\\-quiet\nShow no progress.\n")) << qPrintable(manual);
    EXPECT_TRUE(manual.endsWith("\n.SH NEXT\n")) << qPrintable(manual);
}
