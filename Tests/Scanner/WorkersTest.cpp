#include "Core/BaseLib/Files/TextFile.h"
#include "Core/BaseLib/Process/ThreadCount.h"
#include "Tests/Support/PlatformValues.h"
#include "Tests/Support/ScanBench.h"

#include <QElapsedTimer>
#include <QFile>
#include <QFileInfo>
#include <QRegularExpression>
#include <QSet>
#include <QThread>

#include <algorithm>

namespace {

/// A scan with workers, and what they do to each other and to the machine.
class Workers : public ScanBench {
protected:
    const std::map<QString, QString> kPool = {
        {"FXPROBE_JOBS", "3"}, {"FXPROBE_PROBE_LIMIT", "4"}, {"FXPROBE_MEMORY_LIMIT", "400"}};

    /// Starts a scan with workers.
    bool start(ScannerRun &scanner) const
    {
        for (const auto &[name, value] : kPool)
            scanner.setEnvironment(name, value);
        forgetTrace();
        return scanner.start();
    }
    /// The processes whose numbers plug-ins left.
    std::vector<qint64> left() const
    {
        std::vector<qint64> processes;
        for (const QString &line : m_folder.lines("left"))
            processes.push_back(line.toLongLong());
        return processes;
    }
    static bool runs(const std::vector<qint64> &processes)
    {
        return std::any_of(processes.begin(), processes.end(), isProcessRunning);
    }
    /// Whether all of them end soon: what is ended by force is gone a moment later, and later on a loaded
    /// machine.
    static bool endSoon(const std::vector<qint64> &processes)
    {
        QElapsedTimer clock;
        for (clock.start(); runs(processes) && clock.elapsed() < 5000;)
            QThread::msleep(10);
        return !runs(processes);
    }
    /// Ends the scanner by force. What it started must be gone soon after, and what plug-ins started.
    void killAndWatch(ScannerRun &scanner) const
    {
        std::vector<qint64> started = scanner.children();
        EXPECT_FALSE(started.empty());
        for (const qint64 process : left())
            started.push_back(process);
        scanner.kill();
        scanner.wait();
        EXPECT_TRUE(endSoon(started));
    }
    /// The reason that is kept of a module; empty where it has none.
    QString reason(const QString &module) const
    {
        for (const QString &line : m_folder.lines("Effects/FXProbes.json"))
            if (line.contains('/' + module + ".vst3\""))
                return line.section("\"reason\":\"", 1).section('"', 0, 0);
        return QString();
    }
};

} // namespace

TEST_F(Workers, KeepToThemselvesWhatPluginsDo)
{
    const QByteArray left = '"' + m_folder.path("left").toUtf8() + "\"\n";
    const QByteArray daemon = "effect initialize daemon " + left;
    const struct {
        const char *name;
        QByteArray script;
        const char *reason; ///< none: it is listed; where systems differ, that of Linux/Windows
    } rows[] = {{"Bomb", daemon.repeated(1000),
                 "it started more than 200 processes/it took more than 400 MiB of memory"},
                {"Brood", "effect initialize feed 250\neffect initialize feed 250\nfault initialize hang\n",
                 "it took more than 400 MiB of memory"},
                {"Child", "effect initialize child " + left, ""},
                {"Closed", "effect initialize close-all 1\n", "it closed the channel of its worker/"},
                {"Daemon", daemon, ""},
                {"Garbage", "effect initialize garbage 1\n", "it wrote into the channel of its worker"},
                {"Greedy", "fault initialize memory\n", "it took more than 400 MiB of memory"},
                {"Input", "effect initialize input 1\n", ""},
                {"Late", "effect module-exit late-fault 1000\n", ""},
                {"Patient", "delay initialize 1500\n", ""},
                {"Printed", "effect initialize print 1\nfault initialize abort\n",
                 "it gave up (abort)/it ended its process with exit code 3"},
                {"Terminal", "effect initialize terminal 1\n", ""}};
    for (const auto &row : rows)
        put(row.name + QString(".vst3"), row.script);
    const ScannerOutcome outcome = scanOnce(kPool);
    EXPECT_TRUE(outcome.succeeded()) << qPrintable(outcome.log);
    EXPECT_EQ(m_folder.markers(), QStringList());
    QStringList expected;
    for (const auto &row : rows) {
        const QStringList reasons = QString(row.reason).split('/');
        const QString expectedReason = reasons.value(kSystemsPlace, reasons.first());
        expected.append(row.name + QString(expectedReason.isEmpty() ? "|1|1" : "|0|0"));
        EXPECT_TRUE(reason(row.name).contains(expectedReason) &&
                    reason(row.name).isEmpty() == expectedReason.isEmpty())
            << row.name << ": " << qPrintable(reason(row.name));
    }
    EXPECT_EQ(sortedRecords("Name Enabled Working"), expected) << qPrintable(outcome.log);
    EXPECT_GE(this->left().size(), 2U);
    EXPECT_TRUE(endSoon(this->left()));
}

TEST_F(Workers, LeaveWithTheirScannerAndBlameNobody)
{
    QStringList names;
    for (int number = 0; number < 12; ++number) {
        names.append("P" + QString::number(100 + number));
        put(names.last() + ".vst3", "delay initialize 60\n");
    }
    for (int moment = 1; moment < names.size(); moment += 3) {
        SCOPED_TRACE(moment);
        m_folder.write("Effects/VST3Configuration.xml", {});
        ScannerRun scanner(scannerProgram(), m_folder);
        ASSERT_TRUE(start(scanner) && scanner.waitUntil([&] { return loaded().size() >= moment; }));
        killAndWatch(scanner);
        EXPECT_TRUE(scanOnce(kPool).succeeded());
        QStringList expected;
        for (const QString &name : names)
            expected.append(name + "|1|1");
        EXPECT_EQ(sortedRecords("Name Enabled Working"), expected);
        EXPECT_EQ(m_folder.markers(), QStringList());
    }
}

TEST_F(Workers, LoseNoMarksOfWhatTwoListWhileAnotherHangs)
{
    const QByteArray same = "class P\nid 00000000000000000000000000000001\n";
    put("A.vst3");
    put("B.vst3", same);
    scan();
    mark("P", "Favourite", "1");
    dateLater(put("A.vst3", "fault initialize hang\n"));
    dateLater(put("B.vst3", same));
    put("C.vst3", same + "delay initialize 200\n");
    put("D.vst3", "delay initialize 800\n"); // when it is on disk, so is what came before
    ScannerRun scanner(scannerProgram(), m_folder);
    for (const auto &[name, value] : kPool)
        scanner.setEnvironment(name, value);
    scanner.setEnvironment("FXPROBE_JOBS", "4"); // all at once
    ASSERT_TRUE(scanner.start() &&
                scanner.waitUntil([this] { return m_folder.catalogue().contains("D.vst3"); }));
    killAndWatch(scanner);
    put("A.vst3");
    EXPECT_TRUE(scanOnce(kPool).succeeded());
    EXPECT_EQ(sortedRecords("Name Favourite"), QStringList({"A|0", "D|0", "P|1"}));
}

TEST_F(Workers, LeaveWithTheirScannerWhateverTheirPluginsDo)
{
    const QByteArray script =
        "effect create-instance child \"" + m_folder.path("left").toUtf8() + "\"\nfault initialize hang\n";
    put("P.vst3", script);
    put("Stays.vst3", "effect create-instance stay 1\n" + script);
    ScannerRun scanner(scannerProgram(), m_folder);
    ASSERT_TRUE(start(scanner) && waitForStage(scanner, "P", "initialize") &&
                waitForStage(scanner, "Stays", "initialize"));
    EXPECT_EQ(left().size(), 2U);
    killAndWatch(scanner);
}

TEST_F(Workers, BlameTheOneThatKillsTheirScanner)
{
    for (const char *name : {"A", "B", "C", "D"})
        put(name + QString(".vst3"), "delay initialize 200\n");
    put("Killer.vst3", "effect initialize kill-parent 1\n");
    int runs = 1;
    while (!scanOnce(kPool).succeeded() && runs < 10)
        ++runs;
    EXPECT_EQ(runs, 3) << "one with all at work, one with a suspect alone, and the last one";
    EXPECT_EQ(sortedRecords("Name Enabled Working"),
              QStringList({"A|1|1", "B|1|1", "C|1|1", "D|1|1", "Killer|0|0"}));
    EXPECT_EQ(m_folder.markers(), QStringList());
}

TEST_F(Workers, BeginWithTheSuspectsOfEveryFormatOneByOneAndThenWithTheSlowest)
{
    const QString suspects[] = {put("S.vst2"), put("T.vst2", "fault open abort\n")};
    for (const char *name : {"A", "B", "C"})
        put(name + QString(".vst3"), "delay initialize 600\n");
    const QString slow = put("Slow.vst2");
    ASSERT_TRUE(QFile::resize(slow, 20 << 20)); // as a slow one mostly is
    dateFirst(slow);
    for (const QString &suspect : suspects)
        m_folder.write("Effects/" + QFileInfo(suspect).baseName() + ".scan",
                       QByteArray("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<CrashedPlugin>\n\t<Path>" +
                                  suspect.toUtf8() + "</Path>\n\t<Suspect>1</Suspect>\n</CrashedPlugin>\n")
                           .replace("\n", kLineEnd));
    std::map<QString, QString> environment = kPool;
    environment["FXPROBE_REPORT"] = m_folder.path("report");
    EXPECT_TRUE(scanOnce(environment).succeeded());
    QStringList told;
    QSet<QString> workers;
    for (const QString &line : m_folder.lines("report")) {
        const QString module = line.section("Plugins/", 1).section('.', 0, 0);
        if (line.contains("\"begin\"") || line.contains("\"end\""))
            told.append(line.contains("\"end\"") ? module + '.' : module);
        workers.insert(line.section("\"worker\":", 1));
    }
    workers.remove(QString());
    told.removeDuplicates(); // a culprit may be asked again
    EXPECT_EQ(told.mid(0, 4), QStringList({"S", "S.", "T", "T."}));
    EXPECT_TRUE(told.filter(QRegularExpression("^\\w+$")).mid(2, 3).contains("Slow"))
        << qPrintable(told.join(' '));
    EXPECT_EQ(m_folder.lines("report").filter("\"workerEnd\"").size(), workers.size());
    EXPECT_EQ(m_folder.markers(), QStringList());
}
