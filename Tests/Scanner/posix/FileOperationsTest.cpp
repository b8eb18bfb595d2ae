#include "Tests/Scanner/InterruptedScan.h"
#include "Tests/Support/VST3Fixture.h"

#include <cstdio>
#include <set>

namespace {

/// What happens to the scanner's own file operations, as strace makes it happen.
struct Disturbance {
    const char *name;
    const char *calls;
    const char *what;
    bool lasts; ///< every operation from that moment on

    friend void PrintTo(const Disturbance &row, std::ostream *out) { *out << row.name; }
};

const Disturbance kDisturbances[] = {
    {"Killed", "openat,write,rename,unlink", "signal=KILL", false},
    {"DiskFull", "write", "error=ENOSPC", true},
    {"OneWriteFails", "write", "error=EIO", false},
    {"WriteProtected", "openat,write,rename,unlink", "error=EROFS", true},
    {"NothingDeleted", "unlink", "error=EACCES", true},
    {"NothingReplaced", "rename", "error=EACCES", true},
};

/// Every moment takes minutes; a part of them shows the kind of each.
int stepOfSweep() { return qEnvironmentVariableIsSet("FXPROBE_WHOLE_SWEEP") ? 1 : 17; }

/// A dozen modules, one of them switched off, under a scanner that strace disturbs.
class TracedScan : public InterruptedScan {
protected:
    TracedScan()
        : InterruptedScan({"M0", "M1", "M2", "M3", "M4", "M5", "M6", "M7", "M8", "M9", "Ma", "Mb"})
    {
        mark(kSwitchedOff, "Enabled", "0");
        m_listed = m_folder.catalogue();
        for (const QString &name : m_names) // they write no trace: their own operations are not to fail
            dateLater(addVST3File(m_folder.plugins(), name));
    }
    /// A scan under strace, which writes down the calls to `operations`.
    ScannerOutcome trace(const QStringList &options) const
    {
        ScannerRun scanner("strace", m_folder);
        scanner.setArguments(QStringList{"-f", "-o", m_folder.path("operations")} + options +
                             QStringList{scannerProgram(), m_folder.scanList()});
        scanner.setEnvironment("ASAN_OPTIONS", "detect_leaks=0"); // not when traced
        return scanner.run();
    }
    /// Runs until no marker survives: everything must be listed then, with the user's marks, and what no
    /// marker named must be as it was.
    void expectSettled() const
    {
        std::set<QString> named;
        for (const QString &marker : m_folder.markers())
            named.insert(marker.section('.', 0, 0));
        EXPECT_EQ(distinctNames(), m_names);
        EXPECT_LE(scanUntilSettled(), 1 + static_cast<int>(named.size()));
        EXPECT_EQ(distinctNames(), m_names);
        for (const QString &row : sortedRecords("Name Favourite Enabled Working")) {
            const QString name = row.section('|', 0, 0);
            if (named.count(name) != 0 && row.endsWith("|0|0|0"))
                continue; // stands for the file that the marker named
            const QString state = name == kSwitchedOff ? "|1|0|1" : "|1|1|1";
            EXPECT_TRUE(row.endsWith(state) || (named.count(name) != 0 && row.endsWith("|1|0|0")))
                << qPrintable(row);
        }
    }

    static QStringList sorted(QStringList list)
    {
        list.sort();
        return list;
    }
    /// A file that crashed has a record of its own beside its class's.
    QStringList distinctNames() const
    {
        QStringList names = sortedRecords("Name");
        names.removeDuplicates();
        return names;
    }

    const QString kSwitchedOff = "M3";
};

using UnreadableInput = TracedScan;
using SilentFolder = TracedScan;
class FileOperations : public TracedScan, public testing::WithParamInterface<Disturbance> {};

} // namespace

TEST_P(FileOperations, DisturbedAtAnyMomentLoseNothing)
{
    const QString calls = QString::fromLatin1(GetParam().calls);
    EXPECT_TRUE(trace({"-e", "trace=" + calls}).succeeded());
    const int count = m_folder.lines("operations").size();
    ASSERT_GT(count, 12);
    for (int moment = 1; moment <= count; moment += stepOfSweep()) {
        SCOPED_TRACE(moment);
        m_folder.write(cataloguePath(), m_listed);
        const ScannerOutcome outcome = trace({"-e", "trace=" + calls, "-e",
                                              QStringLiteral("inject=%1:%2:when=%3%4")
                                                  .arg(calls, QLatin1String(GetParam().what))
                                                  .arg(moment)
                                                  .arg(QLatin1String(GetParam().lasts ? "+" : ""))});
        if (!outcome.log.contains(m_folder.scanList())) // a list that cannot be read names no folders
            expectSettled();
    }
}

INSTANTIATE_TEST_SUITE_P(By, FileOperations, testing::ValuesIn(kDisturbances),
                         [](const auto &row) { return std::string(row.param.name); });

TEST_F(UnreadableInput, ChangesNothing)
{
    const std::pair<QString, QString> rows[] = {
        {cataloguePath(), "Cannot write the catalogue " + cataloguePath() + ": the one there cannot be read"},
        {m_folder.plugins(), "Cannot search the folder \"" + m_folder.plugins() + "\": Input/output error"}};
    for (const auto &[path, line] : rows) {
        const ScannerOutcome outcome = trace({"-P", path, "-e", "inject=openat:error=EIO:when=1"});
        EXPECT_TRUE(outcome.succeeded());
        EXPECT_TRUE(outcome.log.contains(line)) << qPrintable(outcome.log);
        EXPECT_EQ(m_folder.catalogue(), m_listed);
        expectSettled();
        m_folder.write(cataloguePath(), m_listed);
    }
}

TEST_F(SilentFolder, IsGivenUpWithWhatIsKnownOfItKept)
{
    addVST3File(m_folder.path("Drive"), "Far");
    addVST3File(m_folder.path("Plugins/sub"), "Near");
    m_folder.writeScanList({m_folder.path("Drive"), m_folder.plugins()});
    scan();
    const QStringList listed = sortedRecords("Name");
    addVST3File(m_folder.plugins(), "New");
    m_folder.write("Plugins/x", {});
    ASSERT_EQ(std::rename(m_folder.path("Plugins/x").toLocal8Bit(),
                          m_folder.plugins().toLocal8Bit() + "/caf\xE9.vst3"),
              0);
    const QString silent[] = {m_folder.path("Drive"), m_folder.path("Plugins/sub")};
    QStringList options{"-e", "inject=getdents64:delay_enter=9000000"};
    for (const QString &folder : silent)
        options += QStringList{"-P", folder};
    qputenv("FXPROBE_PROBE_LIMIT", "3");
    qputenv("FXPROBE_REPORT", m_folder.path("report").toLocal8Bit());
    const ScannerOutcome outcome = trace(options);
    qunsetenv("FXPROBE_PROBE_LIMIT");
    qunsetenv("FXPROBE_REPORT");
    EXPECT_TRUE(outcome.succeeded());
    EXPECT_EQ(sortedRecords("Name"), sorted(listed + QStringList("New"))) << qPrintable(outcome.log);
    const QString report = m_folder.read("report");
    EXPECT_TRUE(report.contains(R"(/caf\\xe9.vst3","reason":"its name is not valid text")"))
        << qPrintable(report);
    for (const QString &folder : silent) {
        EXPECT_TRUE(report.contains("{\"event\":\"looking\",\"path\":\"" + folder + '"'))
            << qPrintable(report);
        EXPECT_TRUE(outcome.log.contains(folder + "\": it gave no answer for 3 s"))
            << qPrintable(outcome.log);
    }
}
