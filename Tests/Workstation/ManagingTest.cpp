#include "Core/BaseLib/Binary/ModuleFile.h"
#include "Tests/Support/PlatformValues.h"
#include "Tests/Workstation/FxScanBench.h"

#include <QFile>

namespace {

/// What users do with plug-ins that are known.
class Managing : public FxScanBench {
protected:
    /// Arguments between blanks; "@" stands for the folder of the plug-ins.
    ScannerOutcome runLine(QString line)
    {
        return run(line.replace('@', m_folder.plugins() + '/').split(' ', Qt::SkipEmptyParts));
    }
    /// The plug-ins that are marked, or do not work: "-" switched off, "!" not working, "x" disabled, "*"
    /// favourite.
    QString marks() const
    {
        QStringList marked;
        for (const char *file : {"VST3Configuration.xml", "FXConfiguration.xml"})
            for (const QString &record : recordsOf(file, "Name Enabled Working Favourite")) {
                const QStringList values = record.split('|');
                const bool isEnabled = values[1] == "1", isWorking = values[2] == "1";
                const QString signs = QString(isEnabled   ? isWorking ? "" : "!"
                                              : isWorking ? "-"
                                                          : "x") +
                                      (values[3] == "1" ? "*" : "");
                if (!signs.isEmpty())
                    marked << values[0] + signs;
            }
        marked.sort();
        return marked.join(' ');
    }
    /// The modules that were loaded, sorted; a killer's chance in a fresh worker is not counted.
    QString asked() const
    {
        QStringList names = loaded();
        names.removeDuplicates();
        names.sort();
        return names.join(' ');
    }
};

} // namespace

TEST_F(Managing, MarksAreSetByNameFileOrPath)
{
    const QString used = put("Comp.vst3");
    put("Copy.vst3", "class Comp\n");
    const QString other = put("Comp.vst2", "name Comp\n");
    put("Pair.vst3", "class A\nclass B\nclass a\n");
    put("Shell.vst2", "child 1 One\nchild 2 Two\nfault entry abort Two\n");
    put("Crash.vst3", "fault initialize abort\n");
    scan();
    const QString shell = QFileInfo(other).fileName().replace("Comp", "sHELL");
    const struct {
        QString arguments;
        int exitCode;
        QByteArray said;
        const char *marks; ///< afterwards
    } rows[] = {
        {"--switch-off Comp", 2, "several plug-ins are named 'Comp'; use the path of one:\n", "Crashx Twox"},
        {"--favourite @Copy.vst3", 2, used.toUtf8().prepend("use the path of what is used in its place:\n  "),
         "Crashx Twox"},
        {"--switch-off B --favourite Nobody", 2, "no plug-in is named 'Nobody'", "Crashx Twox"},
        {"--switch-off B @Comp.vst3", 2, "it takes no folders", "Crashx Twox"},
        {"--switch-off @Comp.vst3", 0, "Comp (VST 3): switched off", "Comp- Crashx Twox"},
        {"--switch-off comp.VST3", 0, "Comp (VST 3): is switched off already", "Comp- Crashx Twox"},
        {"--switch-on Comp.vst3", 0, "Comp (VST 3): switched on\n", "Crashx Twox"},
        {"--switch-off Crash", 0, "nothing to switch off", "Crashx Twox"},
        {"--switch-on Crash", 0, "it cannot be used", "Crashx Twox"},
        {"--favourite " + shell, 0, "Two (VST 2): is a favourite now", "Crashx One* Twox*"},
        {"--no-favourite two --switch-off a", 0, "a (VST 3): switched off", "Crashx One* Twox a-"},
        {"--switch-off Pair.vst3", 0, "B (VST 3): switched off", "A- B- Crashx One* Twox a-"},
    };
    for (const auto &row : rows) {
        const ScannerOutcome outcome = runLine(row.arguments);
        EXPECT_EQ(outcome.exitCode, row.exitCode) << qPrintable(row.arguments);
        EXPECT_TRUE((outcome.standardOutput + outcome.standardError).contains(row.said))
            << outcome.standardOutput.constData() << outcome.standardError.constData();
        EXPECT_EQ(marks(), row.marks) << qPrintable(row.arguments);
    }
    EXPECT_EQ(trace(), QStringList()) << "nothing is loaded for it";
    scan();
    EXPECT_EQ(marks(), "A- B- Crashx One* Twox a-") << "and a scan keeps them";
    EXPECT_EQ(run({"--data-folder", m_folder.path("nowhere"), "--favourite", "B"}).exitCode, 2);
    EXPECT_FALSE(QFileInfo::exists(m_folder.path("nowhere")));
}

TEST_F(Managing, WhatFailedWhileItWasSwitchedOffIsNotUsableAfterwards)
{
    put("Single.vst2");
    put("Pair.vst3", "class A\nclass B\n");
    scan();
    runLine("--switch-off B");
    dateLater(put("Pair.vst3", "class A\nclass B\nfault initialize abort\n"));
    scan();
    runLine("--switch-off Single");
    dateLater(put("Single.vst2", "answer entry null\n"));
    scan();
    EXPECT_EQ(marks(), "Ax B- Pairx Single-");
    EXPECT_TRUE(runLine("--switch-on B").standardOutput.contains("switched on, but it cannot be used"));
    runLine("--switch-on Single"); // is asked now
    scan();
    EXPECT_EQ(marks(), "Ax Bx Pairx Single!");
}

TEST_F(Managing, WhatIsAskedAgainIsNamedOrAll)
{
    put("Copy.vst3", "class Comp\n");
    put("Comp.vst3");
    put("Pair.vst3", "class A\nclass B\n");
    put("Off.vst3");
    put("Shell.vst2", "child 1 One\nchild 2 Two\nfault entry abort Two\n");
    put("Null.vst2", "answer entry null\n");
    put("Crash.vst3", "fault initialize abort\n");
    scan();
    runLine("--switch-off Off --favourite A --favourite Two");
    const char *const kMarks = "A* Crashx Null! Off- Twox*";
    const struct {
        const char *arguments;
        int exitCode;
        const char *asked;
        const char *said;
    } rows[] = {
        {"--rescan A", 0, "Pair", ""},
        {"--rescan @Pair.vst3 --rescan one", 0, "Pair Shell", ""},
        {"--rescan Copy.vst3", 0, "Copy", ""},
        {"--rescan A --rescan Crash", 2, "", "'Crash' is disabled; --retry asks it again"},
        {"--rescan Two", 2, "", "'Two' is disabled"},
        {"--rescan Off", 2, "", "'Off' is switched off; --switch-on it first"},
        {"--rescan Nobody", 2, "", "no plug-in is named 'Nobody'"},
        {"--rescan-all", 0, "Comp Copy Null Pair Shell", ""},
        {"--rescan-all --retry-failed", 0, "Comp Copy Crash Null Pair Shell", ""},
        {"--retry-changed", 0, "", ""},
        {"--rescan-all --list", 2, "", "cannot be combined"},
    };
    for (const auto &row : rows) {
        const ScannerOutcome outcome = runLine(row.arguments);
        EXPECT_EQ(outcome.exitCode, row.exitCode) << row.arguments << outcome.standardError.constData();
        EXPECT_TRUE(outcome.standardError.contains(row.said)) << outcome.standardError.constData();
        EXPECT_EQ(asked(), row.asked) << row.arguments;
        EXPECT_EQ(marks(), kMarks) << row.arguments;
        const bool isTwoAsked = !trace().filter("Shell entry Two").isEmpty();
        EXPECT_EQ(isTwoAsked, QString(row.arguments).contains("retry-failed")) << row.arguments;
    }
    EXPECT_TRUE(runLine("--show Off").standardOutput.contains("in/out       2/2")) << "known from its probe";
}

TEST_F(Managing, OnlyWhatTheScanIsLimitedToIsAskedAgain)
{
    put("a/Crash.vst3", "fault initialize abort\n");
    put("b/Kill.vst3", "fault initialize abort\n");
    scan();
    for (const char *options : {"--retry-failed @a", "--retry-failed --rescan-all @a"}) {
        const ScannerOutcome outcome = runLine(options);
        EXPECT_EQ(outcome.exitCode, 0) << outcome.standardError.constData();
        EXPECT_EQ(asked(), "Crash");
        EXPECT_EQ(marks(), "Crashx Killx") << "that of the other stays disabled";
    }
    const ScannerOutcome other = runLine("--retry Kill @a");
    EXPECT_EQ(other.exitCode, 2);
    EXPECT_TRUE(other.standardError.contains("is named 'Kill' in the folders that are scanned"));
}

TEST_F(Managing, WhatMayWorkNowIsAskedAgain)
{
    put("Same.vst3", "fault initialize abort\n");
    put("Changed.vst3", "fault initialize abort\n");
    const bool isElf = kOwnForm == LibraryForm::Elf; // the library that needs others is of that form
    const QString needy = m_folder.path("Plugins/Needy.vst3");
    const QString corpus = QStringLiteral(FXPROBE_FUZZ_CORPUS "/elf/needs-two");
    ASSERT_TRUE(!isElf || QFile::copy(corpus, needy));
    EXPECT_EQ(reason(scan(), "Needy").startsWith("it needs libgone.so.1"), isElf);
    dateLater(put("Changed.vst3"));
    for (const char *library : {"libgone.so.1", "libaway.so.2"})
        m_folder.write(QString("Plugins/lib/") + library, isElf ? m_folder.read(needy) : QByteArray());
    const QJsonObject result = scan({"--retry-changed"});
    EXPECT_EQ(states(result)["Changed"], "ok");
    EXPECT_EQ(asked(), "Changed");
    EXPECT_EQ(reason(result, "Needy").contains("which needs the symbol \"gone\""), isElf) << "it was loaded";
}
