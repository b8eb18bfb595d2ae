#include "Tests/Scanner/DisturbedScan.h"

#include <QFileInfo>

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

class TracedScan : public DisturbedScan {
protected:
    TracedScan()
    {
        for (const QString &name : m_names) // their own file operations are not to fail
            addVST3File(m_folder.plugins(), name);
        touchModules(m_names);
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
};

class FileOperations : public TracedScan, public testing::WithParamInterface<Disturbance> {
protected:
    int countCalls(const QString &calls) const
    {
        EXPECT_TRUE(trace({"-e", "trace=" + calls}).succeeded());
        return m_folder.lines("operations").size();
    }
};

} // namespace

TEST_P(FileOperations, DisturbedAtAnyMomentLoseNothing)
{
    const QString calls = QString::fromLatin1(GetParam().calls);
    const QByteArray before = m_folder.catalogue();
    const int count = countCalls(calls);
    ASSERT_GT(count, 12);
    int moments = 0;
    for (int moment = 1; moment <= count; moment += stepOfSweep(), ++moments) {
        SCOPED_TRACE(moment);
        m_folder.write(cataloguePath(), before);
        const ScannerOutcome outcome = trace({"-e", "trace=" + calls, "-e",
                                              QStringLiteral("inject=%1:%2:when=%3%4")
                                                  .arg(calls, QLatin1String(GetParam().what))
                                                  .arg(moment)
                                                  .arg(QLatin1String(GetParam().lasts ? "+" : ""))});
        if (outcome.log.contains(m_folder.scanList()))
            continue; // one that cannot be read names no folders, and everything counts as gone
        EXPECT_EQ(listed(), m_names);
        expectSettled(namedByMarkers());
    }
    RecordProperty("moments", moments);
    std::cout << moments << " of " << count << " moments\n";
}

TEST_F(TracedScan, ACatalogueThatCannotBeReadIsNotReplaced)
{
    const QByteArray before = m_folder.catalogue();
    const ScannerOutcome outcome = trace({"-P", cataloguePath(), "-e", "inject=openat:error=EIO:when=1"});
    EXPECT_TRUE(outcome.succeeded());
    EXPECT_EQ(
        logLines(outcome),
        QStringList({QStringLiteral("Cannot use the catalogue %1: Input/output error").arg(cataloguePath()),
                     QStringLiteral("Cannot write the catalogue %1: the one there cannot be read: "
                                    "Input/output error")
                         .arg(cataloguePath())}));
    EXPECT_EQ(m_folder.catalogue(), before);
    expectSettled({});
}

TEST_F(TracedScan, PluginsInAFolderThatCannotBeReadAreKept)
{
    const QByteArray before = m_folder.catalogue();
    const ScannerOutcome outcome = trace({"-P", m_folder.plugins(), "-e", "inject=openat:error=EIO:when=1"});
    EXPECT_TRUE(outcome.succeeded());
    EXPECT_EQ(
        logLines(outcome),
        QStringList(
            QStringLiteral("Cannot search the folder \"%1\": Input/output error").arg(m_folder.plugins())));
    EXPECT_EQ(m_folder.catalogue(), before);
    expectSettled({});
}

INSTANTIATE_TEST_SUITE_P(By, FileOperations, testing::ValuesIn(kDisturbances),
                         [](const auto &row) { return std::string(row.param.name); });
